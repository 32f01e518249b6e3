// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/partitions/Finding.h"
#include "pellar/partitions/PartitionMap.h"

namespace pellar {

/// All that is wrong with a classic partition table. It has no second copy, so none of it can be
/// repaired without a person. Pure.
[[nodiscard]] std::vector<Finding> mbrFindings(const PartitionMap& map);

}  // namespace pellar
