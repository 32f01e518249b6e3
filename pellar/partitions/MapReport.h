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

}  // namespace pellar
