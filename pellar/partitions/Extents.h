// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/partitions/Finding.h"

namespace pellar {

/// Where a partition lies.
struct Extent {
    std::uint64_t first = 0;
    std::uint64_t last = 0;  ///< not before `first`
    std::string label;       ///< what the partition is called in findings
};

/// "3", or "3 “Data”", fit to be shown and to be put into a text.
[[nodiscard]] std::string partitionLabel(std::uint64_t number, const std::string& name);

/// Adds a finding for every partition that another one reaches into, not for every pair.
void findOverlaps(std::vector<Extent> extents, std::vector<Finding>& findings);

}  // namespace pellar
