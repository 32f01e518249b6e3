// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/disks/SystemDisks.h"

#include <optional>
#include <set>
#include <string>

namespace orvane {

/// Reads the system's disks together with what their drives say of themselves. One thread at a
/// time.
class DiskReader {
public:
    /// As readSystemDisks. UDisks2 is asked before the disks are read, and waited for after that:
    /// the first time three seconds at most, for it may have to be started, later 50 ms. When it is
    /// late, what it said the last time stands.
    [[nodiscard]] std::vector<DiskTree> read(const DiskSources& sources);

private:
    std::optional<std::set<std::string>> failing_;  ///< none before the first answer
};

/// Marks a disk and all its parts when the drive of one of them is failing.
void markFailing(std::vector<DiskTree>& disks, const std::set<std::string>& failingNodes);

}  // namespace orvane
