// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Array.h"

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace orvane {

struct DiskFacts;

/// When the records of a list were saved.
struct RecordTimes {
    using Time = std::chrono::system_clock::time_point;
    /// The records from `first` on, up to the next stretch.
    struct Stretch {
        std::size_t first = 0;
        Time time;
    };

    std::vector<Stretch> stretches;  ///< in the list's order
    std::size_t count = 0;           ///< records behind these have no time yet: they are new

    void add(std::size_t end, Time time)
    {
        if (end > count && (stretches.empty() || stretches.back().time != time))
            stretches.push_back({count, time});
        count = end;
    }
    /// What lies in front of it in the list.
    void insertInFront(const RecordTimes& older)
    {
        for (Stretch& stretch : stretches)
            stretch.first += older.count;
        stretches.insert(stretches.begin(), older.stretches.begin(), older.stretches.end());
        count += older.count;
    }
};

/// Who keeps the disks' check histories beyond the life of the disk objects. Main thread only.
class HistoryKeeper {
public:
    virtual ~HistoryKeeper() = default;

    /// The list that the disk's records are appended to: the same for one volume until `revision`
    /// grows.
    virtual contract::Array historyOf(const DiskFacts& disk) = 0;
    virtual std::uint64_t revision() const = 0;
    /// Valid until the history changes.
    virtual const RecordTimes& timesOf(const DiskFacts& disk) = 0;
    virtual void replaceHistoryOf(const DiskFacts& disk, const contract::Array& history) = 0;
    /// Empties the list; NO when it was empty.
    virtual bool clearHistoryOf(const DiskFacts& disk) = 0;
};

}  // namespace orvane
