// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Array.h"

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <functional>
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

/// The histories of a disk and of what is inside it, as one list. The log asks for it with every
/// reload, and while a tool prints there are many: what is new is added to the list that is there,
/// so that keeping up costs the same per record however long the histories are.
class MergedHistory {
public:
    /// Answers the times of the history at a position in the list of histories.
    using TimesLookup = std::function<const RecordTimes*(std::size_t history)>;

    /// The list of all records in the order of their times, each history's in its own order; where
    /// only one history has any, that one, and no list where none has. What came at the same time
    /// goes on with the history that the last record was of, because one job runs at a time. A
    /// history that was cleared or replaced begins a new list.
    contract::Array of(const std::vector<contract::Array>& histories, const TimesLookup& timesOf);

private:
    /// A history as far as it was taken over: enough to see that it has only grown since.
    struct Part {
        contract::Array history;
        std::size_t size = 0;
        contract::Value first;
        contract::Value last;

        bool hasOnlyGrown(const contract::Array& now) const;
        void take(std::size_t end, const contract::Array& merged);
    };

    bool canGoOn(const std::vector<contract::Array>& histories) const;
    void takeNew(const TimesLookup& timesOf);

    contract::Array merged_;
    std::vector<Part> parts_;
    std::size_t newest_ = 0;  ///< the part that the last record is of
};

}  // namespace orvane
