// SPDX-License-Identifier: Apache-2.0
#include "pellar/partitions/MapReport.h"

#include "pellar/partitions/Finding.h"

#include <algorithm>
#include <limits>

namespace pellar {
namespace {

using Findings = std::vector<Finding>;

std::string labelOf(const MBRPartition& partition)
{
    return partitionLabel(static_cast<std::uint64_t>(partition.number), {});
}

void addBootFlags(const std::vector<MBRPartition>& partitions, Findings& findings)
{
    const MBRPartition* active = nullptr;
    for (const MBRPartition& partition : partitions) {
        if (partition.isLogical())
            continue;
        if (!partition.entry.hasKnownFlag())
            findings.push_back({FindingKind::BadBootFlag, {labelOf(partition)}});
        if (partition.entry.flag != 0x80)
            continue;
        if (active != nullptr)
            findings.push_back({FindingKind::TwoActive, {labelOf(*active), labelOf(partition)}});
        active = &partition;
    }
}

void addPlace(const MBRPartition& partition, const PartitionMap& map, Findings& findings)
{
    const std::string label = labelOf(partition);
    if (partition.count() == 0)
        findings.push_back({FindingKind::EmptyPartition, {label}});
    else if (partition.first == 0)
        findings.push_back({FindingKind::StartsAtMap, {label}});
    else if (!isOnDisk(partition.first, partition.count(), map.sectorCount))
        findings.push_back({FindingKind::BeyondDisk,
                            {partition.first + partition.count() - 1, map.lastSector(), label}});
}

/// Those of one rank: the primaries, with the extended one among them, or the logical ones.
void addOverlaps(const std::vector<MBRPartition>& partitions, bool isLogical, Findings& findings)
{
    std::vector<Extent> extents;
    for (const MBRPartition& partition : partitions)
        if (partition.isLogical() == isLogical && partition.count() > 0)
            extents.push_back(
                {partition.first, partition.first + partition.count() - 1, labelOf(partition)});
    findOverlaps(std::move(extents), findings);
}

void addLogicalPlaces(const std::vector<MBRPartition>& partitions, Findings& findings)
{
    const auto extended =
        std::find_if(partitions.begin(), partitions.end(),
                     [](const MBRPartition& partition) { return partition.entry.isExtended(); });
    for (const MBRPartition& partition : partitions) {
        if (!partition.isLogical() || partition.count() == 0)
            continue;
        const bool isInside =
            partition.first > extended->first &&
            isOnDisk(partition.first - extended->first, partition.count(), extended->count());
        if (!isInside)
            findings.push_back({FindingKind::OutsideExtended, {labelOf(partition)}});
    }
}

void addChain(const MBRPartitions& mbr, Findings& findings)
{
    if (mbr.extendedCount > 1)
        findings.push_back({FindingKind::SeveralExtended, {}});
    switch (mbr.chain) {
        case ChainFault::None: break;
        case ChainFault::Broken: findings.push_back({FindingKind::ChainBroken, {}}); break;
        case ChainFault::Outside: findings.push_back({FindingKind::ChainOutside, {}}); break;
        case ChainFault::Loop: findings.push_back({FindingKind::ChainLoop, {}}); break;
        case ChainFault::TooLong: findings.push_back({FindingKind::ChainTooLong, {}}); break;
    }
}

/// It takes the place of the protective entry: from the first sector to the last, or as far as an
/// MBR counts, before a GUID partition table that is good in both copies.
bool hasReplacedProtective(const PartitionMap& map)
{
    constexpr std::uint64_t greatest = std::numeric_limits<std::uint32_t>::max();
    const std::vector<MBRPartition>& partitions = map.mbr.partitions;
    return map.hasCopiesInPlace() && partitions.size() == 1 && partitions.front().first == 1 &&
           partitions.front().count() >= std::min(map.lastSector(), greatest);
}

}  // namespace

std::vector<Finding> mbrFindings(const PartitionMap& map)
{
    Findings findings;
    const std::vector<MBRPartition>& partitions = map.mbr.partitions;
    addBootFlags(partitions, findings);
    for (const MBRPartition& partition : partitions)
        addPlace(partition, map, findings);
    addOverlaps(partitions, false, findings);
    addOverlaps(partitions, true, findings);
    addLogicalPlaces(partitions, findings);
    addChain(map.mbr, findings);
    if (hasReplacedProtective(map))
        findings.push_back({FindingKind::ProtectiveReplaced, {}});
    else if (map.primary.header.hasSignature() || map.backup.header.hasSignature())
        findings.push_back({FindingKind::Remnants, {}});
    return findings;
}

}  // namespace pellar
