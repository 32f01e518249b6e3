// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Array.h"
#include "orvane/support/files/Failure.h"
#include "orvane/support/history/Database.h"
#include "orvane/support/history/HistoryDatabase.h"
#include "orvane/support/history/RecordTable.h"
#include "orvane/support/history/RunTable.h"

#include <cstdint>
#include <filesystem>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

namespace orvane {

/// The check histories on the disk, by volume. Main thread only; several programs may use one
/// database at a time.
///
/// What `append` has answered YES to is there after the program was killed. How many records a
/// volume keeps is limited, see RecordTable.
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

    /// All that the volume has.
    [[nodiscard]] RecordRange recordsOf(std::string_view key);
    /// Appends those of the records that are still there, oldest first, and their times.
    void load(RecordRange records, const contract::Array& history, RecordTimes& times);
    /// Appends the records from `firstNew` on to the volume's, with their times; where none are
    /// given, with the present one. All of them or, when it answers NO, none: try again later.
    [[nodiscard]] bool append(std::string_view key, const contract::Array& history,
                              std::size_t firstNew, const RecordTimes& times = {});
    /// The volume's records and its runs.
    [[nodiscard]] bool clear(std::string_view key);

    /// The run's number; 0 when it could not be written.
    std::int64_t beginRun(std::string_view key, std::string_view action, Run::Time started);
    void endRun(std::int64_t run, const RunEnd& end, Run::Time finished);
    [[nodiscard]] std::vector<Run> runs(std::string_view key);
    [[nodiscard]] std::optional<Run> lastRun(std::string_view key);

    /// Grows whenever this program writes or removes a run.
    [[nodiscard]] std::uint64_t runsRevision() const { return runsRevision_; }
    /// Whether another program has written since this was asked last, or the store was opened.
    [[nodiscard]] bool hasForeignChanges();

    /// Grows when a new database had to be begun in the middle: everything is unsaved then.
    [[nodiscard]] std::uint64_t generation() const { return generation_; }
    /// NO when the histories end with the program.
    [[nodiscard]] bool isKept() const { return isKept_; }

private:
    /// Gone before the database is.
    struct Tables {
        Tables(Database& database, const Limits& limits);

        InternTable volumes;
        RecordTable records;
        RunTable runs;
    };
    /// Why the database did not do what it was asked.
    struct Mishap {
        std::string reason;
        bool isDamage = false;
    };

    void open();
    /// What could not be written while another program held the database. It is as soon as that is
    /// possible, and at the end.
    struct LateRun {
        std::int64_t run = 0;  ///< its number in the database, once it has one
        std::string key;
        std::string action;
        Run::Time started;
        std::optional<RunEnd> end;  ///< none as long as the run goes on, and when it is written
        Run::Time finished;
    };

    Mishap lastMishap();
    std::int64_t noteBegin(std::string_view key, std::string_view action, Run::Time started);
    void writeLate();
    bool failedTo(const std::string& attempt, const Mishap& mishap);
    void countAdded(std::int64_t records);

    const std::filesystem::path file_;
    const Limits limits_;
    const WarningSink warn_;

    Database database_;
    std::unique_ptr<Tables> tables_;
    std::optional<Checkpointer> checkpointer_;  ///< where the histories are kept
    std::int64_t addedSinceCheckpoint_ = 0;
    bool isKept_ = false;
    bool hasWarned_ = false;
    std::uint64_t generation_ = 0;
    std::uint64_t runsRevision_ = 0;
    std::int64_t dataVersion_ = 0;  ///< of the database, when it was asked last
    std::vector<LateRun> late_;
};

}  // namespace orvane
