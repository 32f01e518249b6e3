// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/disks/SystemDisks.h"

#include <set>
#include <string>

namespace orvane {

/// Reads the system's disks together with what their drives say of themselves. One thread at a
/// time.
class DiskReader {
public:
    /// As readSystemDisks. UDisks2 is asked before the disks are read and waited for no longer
    /// than 50 ms after that; when it is late, what it said the last time stands.
    [[nodiscard]] std::vector<DiskTree> read(const DiskSources& sources);

private:
    std::set<std::string> failing_;
};

/// Marks a disk and all its parts when the drive of one of them is failing.
void markFailing(std::vector<DiskTree>& disks, const std::set<std::string>& failingNodes);

}  // namespace orvane
