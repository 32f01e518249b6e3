// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/host/foundation/Array.h"

#include <cstdint>

namespace orvane {

struct DiskFacts;

/// Who keeps the disks' check histories beyond the life of the disk objects. Main thread only.
class HistoryKeeper {
public:
    virtual ~HistoryKeeper() = default;

    /// The list that the disk's records are appended to: the same for one volume until `revision`
    /// grows.
    virtual fixwell::Array historyOf(const DiskFacts& disk) = 0;
    virtual std::uint64_t revision() const = 0;
    virtual void replaceHistoryOf(const DiskFacts& disk, const fixwell::Array& history) = 0;
    /// Empties the list; NO when it was empty.
    virtual bool clearHistoryOf(const DiskFacts& disk) = 0;
};

}  // namespace orvane
