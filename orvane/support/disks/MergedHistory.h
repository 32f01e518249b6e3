// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/host/foundation/Array.h"

#include <cstddef>
#include <vector>

namespace orvane {

/// The histories of a disk and of what is inside it, as one list. The log asks for it with every
/// reload, and while a tool prints there are many: what is new is added to the list that is there,
/// so that keeping up costs the same per record however long the histories are.
class MergedHistory {
public:
    /// The list of all records; where only one history has any, that one. At first one history
    /// after the other, then each new record behind all others, so that the newest is the last one
    /// whichever disk it concerns. A history that was cleared or replaced begins a new list.
    fixwell::Array of(const std::vector<fixwell::Array>& histories);

private:
    /// A history as far as it was taken over: enough to see that it has only grown since.
    struct Part {
        fixwell::Array history;
        std::size_t size = 0;
        fixwell::Value first;
        fixwell::Value last;

        bool hasOnlyGrown(const fixwell::Array& now) const;
        void takeNew(const fixwell::Array& merged);
    };

    bool canGoOn(const std::vector<fixwell::Array>& histories) const;

    fixwell::Array merged_;
    std::vector<Part> parts_;
};

}  // namespace orvane
