// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/partitions/Finding.h"
#include "pellar/partitions/PartitionMap.h"

namespace pellar {

/// All that is wrong with a GUID partition table, its copies first, then its partitions. Pure.
[[nodiscard]] std::vector<Finding> gptFindings(const PartitionMap& map);

/// Two good copies that say the same.
[[nodiscard]] bool isSameTable(const GPTHeader& a, const GPTHeader& b);

}  // namespace pellar
