// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/disks/HistoryKeeper.h"

#include <cstddef>
#include <functional>
#include <vector>

namespace orvane {

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
