// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/partitions/Finding.h"
#include "pellar/partitions/PartitionMap.h"

namespace pellar {

enum class MapVerdict {
    None,  ///< there is no partition map
    Sound,
    Repairable,
    NeedsPerson,  ///< damaged, and nothing is written
};

struct MapReport {
    MapVerdict verdict = MapVerdict::None;
    std::vector<Finding> findings;  ///< at most a few dozen

    bool has(FindingKind kind) const;
};

/// Judges a map by what was read of it. Pure.
[[nodiscard]] MapReport reportOn(const PartitionMap& map);

/// All that is wrong with a GUID partition table, its copies first, then its partitions. Pure.
[[nodiscard]] std::vector<Finding> gptFindings(const PartitionMap& map);

/// Two good copies that say the same.
[[nodiscard]] bool isSameTable(const GPTHeader& a, const GPTHeader& b);

/// All that is wrong with a classic partition table. It has no second copy, so none of it can be
/// repaired without a person. Pure.
[[nodiscard]] std::vector<Finding> mbrFindings(const PartitionMap& map);

}  // namespace pellar
