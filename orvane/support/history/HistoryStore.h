// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/host/foundation/Array.h"
#include "orvane/support/Failure.h"
#include "orvane/support/history/Checkpointer.h"
#include "orvane/support/history/Database.h"
#include "orvane/support/history/HistorySchema.h"
#include "orvane/support/history/RecordEncoding.h"
#include "orvane/support/history/RunLedger.h"

#include <cstdint>
#include <deque>
#include <filesystem>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>

namespace orvane {

/// The check histories on the disk, by volume. Main thread only; several programs may use one
/// database at a time.
///
/// What `save` has answered YES to is there after the program was killed. A volume keeps a limited
/// number of records: older runs are dropped whole, and of a run that alone exceeds the limit, the
/// oldest records. They are dropped little by little while others are appended, and the rest at
/// the end.
class HistoryStore {
public:
    struct Limits {
        std::int64_t recordsOfVolume = 1'000'000;
    };

    /// An empty path keeps nothing.
    HistoryStore(std::filesystem::path file, Limits limits, WarningSink warn);
    HistoryStore(const HistoryStore&) = delete;
    HistoryStore& operator=(const HistoryStore&) = delete;
    ~HistoryStore();

    /// The numbers of some records of a volume. They follow each other closely, and newer records
    /// have higher ones.
    struct Range {
        std::int64_t next = 0;
        std::int64_t end = 0;  ///< behind the newest

        std::int64_t size() const { return end - next; }
    };

    /// All that the volume has.
    [[nodiscard]] Range recordsOf(std::string_view key);
    /// Appends those of the records that are still there, oldest first.
    void load(Range records, const fixwell::Array& history);
    /// Appends the records from `firstNew` on to the volume's. All of them or, when it answers
    /// NO, none: try again later.
    [[nodiscard]] bool append(std::string_view key, const fixwell::Array& history,
                              std::size_t firstNew);
    /// The volume's records and its runs.
    [[nodiscard]] bool clear(std::string_view key);

    /// The run's number; 0 when it could not be written.
    std::int64_t beginRun(std::string_view key, std::string_view action, Run::Time started);
    void endRun(std::int64_t run, const RunEnd& end, Run::Time finished);
    [[nodiscard]] std::vector<Run> runs(std::string_view key);
    [[nodiscard]] std::optional<Run> lastRun(std::string_view key);

    /// Grows when a new database had to be begun in the middle: everything is unsaved then.
    [[nodiscard]] std::uint64_t generation() const { return generation_; }
    /// NO when the histories end with the program.
    [[nodiscard]] bool isKept() const { return isKept_; }

private:
    struct Statements;
    /// Why the database did not do what it was asked.
    struct Mishap {
        std::string reason;
        bool isDamage = false;
    };
    struct KnownShape {
        RecordShape shape;
        std::int64_t number;
    };

    void open();
    Mishap lastMishap() const;
    bool failedTo(std::string_view attempt, const Mishap& mishap);
    std::int64_t knownVolume(std::string_view key);
    std::int64_t volumeNumber(std::string_view key);
    bool read(Range records, const fixwell::Array& history);
    std::int64_t nextRecord(std::int64_t volume);
    std::int64_t oldestRecord(std::int64_t volume);
    std::int64_t endOfRunAt(std::int64_t record, std::int64_t next);
    bool makeRoom(std::int64_t volume, std::int64_t added);
    bool dropSurplus(std::int64_t volume, std::int64_t most);
    std::int64_t found(Statement& find, std::string_view text);
    std::int64_t interned(Statement& find, Statement& add, std::string_view text);
    const KnownShape* shapeOf(const fixwell::Dictionary& record);
    std::int64_t styleNumber(const fixwell::TextStyle* style);
    const fixwell::TextStyle* styleNumbered(std::int64_t number);
    const RecordShape* shapeNumbered(std::int64_t number);
    bool insert(std::int64_t id, const fixwell::Dictionary& record, std::int64_t time);
    bool insertAll(std::int64_t volume, const fixwell::Array& history, std::size_t firstNew);
    void forgetInterned();
    void countAdded(std::int64_t records);

    const std::filesystem::path file_;
    const Limits limits_;
    const WarningSink warn_;

    Database database_;
    std::unique_ptr<Statements> statements_;    ///< gone before the database is
    std::optional<Checkpointer> checkpointer_;  ///< where the histories are kept
    std::int64_t addedSinceCheckpoint_ = 0;
    bool isKept_ = false;
    bool hasWarned_ = false;
    std::uint64_t generation_ = 0;

    /// Volumes with more records than they may have: up to where theirs are to be dropped.
    std::map<std::int64_t, std::int64_t> surplus_;

    // What the interning tables are known to hold.
    std::deque<KnownShape> shapes_;
    std::unordered_map<const fixwell::TextStyle*, std::int64_t> styleNumbers_;
    std::map<std::int64_t, fixwell::TextStyle> stylesRead_;
    std::map<std::int64_t, RecordShape> shapesRead_;
    std::string extraRoom_;
};

}  // namespace orvane
