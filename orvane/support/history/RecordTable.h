// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Array.h"
#include "orvane/support/disks/DiskHistory.h"
#include "orvane/support/history/Database.h"
#include "orvane/support/history/RecordEncoding.h"
#include "orvane/support/history/RecordPage.h"

#include <chrono>
#include <cstdint>
#include <map>
#include <optional>
#include <span>
#include <string>

namespace orvane {

/// The numbers of some records of a volume. They follow each other closely, and newer records have
/// higher ones.
struct RecordRange {
    std::int64_t next = 0;
    std::int64_t end = 0;  ///< behind the newest

    std::int64_t size() const { return end - next; }
};

/// The records of all volumes, a limited number of each: when there are more, older runs are
/// dropped whole, and of a run that alone exceeds the limit, the oldest records. They are dropped
/// little by little while others are appended, and the rest at the end. Volumes go by their
/// numbers. The database outlives this object.
class RecordTable {
public:
    using Time = std::chrono::system_clock::time_point;

    RecordTable(Database& database, std::int64_t mostOfVolume);

    [[nodiscard]] RecordRange recordsOf(std::int64_t volume);
    /// Appends those of the records that are still there to the history, oldest first, and their
    /// times to `times`. Records that lie on one page are read together, with the first of them.
    [[nodiscard]] bool read(RecordRange records, const contract::Array& history,
                            RecordTimes& times);
    /// Appends the history's records from `firstNew` on to the volume's; where there are no
    /// times, with `now`. Within a transaction.
    [[nodiscard]] bool append(std::int64_t volume, const contract::Array& history,
                              std::size_t firstNew, const RecordTimes& times, Time now);
    [[nodiscard]] bool removeAll(std::int64_t volume);
    /// At the end: what cannot be dropped now will be when the volume is appended to again.
    void dropAllSurplus();
    /// A transaction has failed: what was written in it is not there.
    void forgetWritten() { vocabulary_.forget(); }

private:
    std::int64_t oldest(std::int64_t volume);
    std::int64_t behindNewest(std::int64_t volume);
    std::int64_t endOfRunAt(std::int64_t record, std::int64_t next);
    bool insert(std::int64_t id, std::span<const contract::Value> records, std::int64_t time);
    std::optional<NumberedColumns> numbered(const contract::Value& record);
    void take(const NumberedColumns& record, const contract::Array& history);
    bool makeRoom(std::int64_t volume, std::int64_t added);
    bool dropSurplus(std::int64_t volume, std::int64_t most);
    bool remove(std::int64_t first, std::int64_t end);

    const std::int64_t mostOfVolume_;
    RecordVocabulary vocabulary_;
    Statement add_, read_, oldest_, newest_, endOfRun_, remove_;
    /// Volumes with more records than they may have: up to where theirs are to be dropped.
    std::map<std::int64_t, std::int64_t> surplus_;
    std::string extraRoom_;
    std::string page_;
};

}  // namespace orvane
