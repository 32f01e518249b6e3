// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Result.h"
#include "pellar/partitions/MapReport.h"
#include "pellar/texts/Sentence.h"

namespace pellar {

/// Whole sectors that take the place of others.
struct SectorWrite {
    std::uint64_t first = 0;
    Bytes after;
    std::string_view what;  ///< a step in English, which is the text key
};

/// What makes the map sound again: it may be written in any order, as what it overwrites is kept.
/// Nothing in it touches a partition.
struct RepairPlan {
    std::vector<SectorWrite> writes;
};

/// A disk as it will be when the plan is carried out. The references outlive it.
class PlannedSectors final : public Sectors {
public:
    PlannedSectors(const Sectors& disk, const RepairPlan& plan) : disk_(disk), plan_(plan) {}

    std::uint32_t sectorBytes() const override { return disk_.sectorBytes(); }
    std::uint64_t count() const override { return disk_.count(); }
    [[nodiscard]] std::optional<Bytes> read(std::uint64_t first,
                                            std::uint64_t number) const override;

private:
    const Sectors& disk_;
    const RepairPlan& plan_;
};

/// The plan for a map that can be repaired, or why there is none. Reads, never writes.
[[nodiscard]] Result<RepairPlan, Sentence> planRepair(const PartitionMap& map,
                                                      const MapReport& report,
                                                      const Sectors& sectors);

}  // namespace pellar
