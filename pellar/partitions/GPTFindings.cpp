// SPDX-License-Identifier: Apache-2.0
#include "pellar/partitions/MapReport.h"

#include "pellar/partitions/Finding.h"

#include <algorithm>
#include <limits>
#include <map>
#include <optional>

namespace pellar {
namespace {

using Findings = std::vector<Finding>;

/// The same five faults of either copy.
struct CopyKinds {
    FindingKind unreadable;
    FindingKind missing;
    FindingKind headerChecksum;
    FindingKind headerNumbers;
    FindingKind entriesChecksum;
};
constexpr CopyKinds primaryKinds{
    FindingKind::PrimaryUnreadable, FindingKind::PrimaryMissing, FindingKind::PrimaryHeaderChecksum,
    FindingKind::PrimaryHeaderNumbers, FindingKind::PrimaryEntriesChecksum};
constexpr CopyKinds backupKinds{FindingKind::BackupUnreadable, FindingKind::BackupMissing,
                                FindingKind::BackupHeaderChecksum, FindingKind::BackupHeaderNumbers,
                                FindingKind::BackupEntriesChecksum};

std::optional<FindingKind> faultOf(const GPTCopy& copy, const CopyKinds& kinds)
{
    switch (copy.header.fault) {
        case HeaderFault::Unreadable: return kinds.unreadable;
        case HeaderFault::Missing: return kinds.missing;
        case HeaderFault::WrongChecksum: return kinds.headerChecksum;
        case HeaderFault::WrongPlace:
        case HeaderFault::Nonsense: return kinds.headerNumbers;
        case HeaderFault::None: break;
    }
    switch (copy.entriesFault) {
        case GPTCopy::EntriesFault::Unreadable: return kinds.unreadable;
        case GPTCopy::EntriesFault::WrongChecksum: return kinds.entriesChecksum;
        case GPTCopy::EntriesFault::NotRead:
        case GPTCopy::EntriesFault::None: break;
    }
    return std::nullopt;
}

/// How many sectors the disk had when the map was made, by the copy that counts.
std::uint64_t sectorsWhenMade(const PartitionMap& map, const GPTCopy& valid)
{
    const GPTHeader& header = valid.header.header;
    const std::uint64_t last = &valid == &map.primary ? header.otherPlace : header.place;
    return last == std::numeric_limits<std::uint64_t>::max() ? last : last + 1;
}

void addCopies(const PartitionMap& map, Findings& findings)
{
    const GPTCopy* const valid = map.validCopy();
    const std::uint64_t made = valid != nullptr ? sectorsWhenMade(map, *valid) : 0;
    const bool isCut = made > map.sectorCount;
    if (const auto fault = faultOf(map.primary, primaryKinds))
        findings.push_back({*fault, {}});
    if (isCut)
        findings.push_back({FindingKind::DiskCut, {made, map.sectorCount}});
    else if (const auto fault = faultOf(map.backup, backupKinds))
        findings.push_back({*fault, {}});
    if (valid == nullptr)
        findings.push_back({FindingKind::NoValidCopy, {}});
    else if (made < map.sectorCount)
        findings.push_back({FindingKind::BackupNotAtEnd, {map.sectorCount - made}});
    if (map.primary.isGood() && map.backup.isGood() &&
        !isSameTable(map.primary.header.header, map.backup.header.header))
        findings.push_back({FindingKind::CopiesDiffer, {}});
    // A repair would write over the start or the end of what fills the disk: a file system, or the
    // superblock that a RAID keeps behind an array with a map of its own.
    if (!map.hasCopiesInPlace() && !map.wholeSignature.empty())
        findings.push_back({FindingKind::DiskFilled, {map.wholeSignature}});
}

void addProtective(const PartitionMap& map, Findings& findings)
{
    if (!map.boot.hasProtective()) {
        findings.push_back({FindingKind::ProtectiveMissing, {}});
        return;
    }
    if (map.boot.ordinaryCount() > 0) {
        findings.push_back({FindingKind::Hybrid, {}});
        return;
    }
    constexpr std::uint64_t greatest = std::numeric_limits<std::uint32_t>::max();
    const auto entry = std::find_if(map.boot.entries.begin(), map.boot.entries.end(),
                                    [](const MBREntry& e) { return e.isProtective(); });
    if (entry->start != 1)
        findings.push_back({FindingKind::ProtectiveWrongStart, {}});
    // Some systems write the greatest size on any disk, and nothing minds.
    else if (entry->count != greatest && entry->count != map.lastSector())
        findings.push_back({FindingKind::ProtectiveWrongSize, {}});
}

void addPlace(const GPTEntry& entry, const std::string& label, const PartitionMap& map,
              const GPTHeader& header, Findings& findings)
{
    if (entry.last >= map.sectorCount)
        findings.push_back({FindingKind::BeyondDisk, {entry.last, map.lastSector(), label}});
    else if (entry.first < header.firstUsable || entry.last > header.lastUsable)
        findings.push_back(
            {FindingKind::OutsideUsable, {header.firstUsable, header.lastUsable, label}});
}

void addPartitions(const PartitionMap& map, const GPTCopy& copy, Findings& findings)
{
    std::vector<Extent> extents;
    std::map<GUID, std::string> owners;
    for (const GPTEntry& entry : usedEntries(copy.entries, copy.header.header)) {
        const std::string label = partitionLabel(entry.number, entry.name);
        if (entry.last < entry.first) {
            findings.push_back({FindingKind::EndBeforeStart, {entry.first, entry.last, label}});
        } else {
            addPlace(entry, label, map, copy.header.header, findings);
            extents.push_back({entry.first, entry.last, label});
        }
        const auto [owner, isNew] = owners.emplace(entry.unique, label);
        if (!isNew)
            findings.push_back({FindingKind::SameIdentifier, {owner->second, label}});
    }
    findOverlaps(std::move(extents), findings);
}

}  // namespace

std::vector<Finding> gptFindings(const PartitionMap& map)
{
    Findings findings;
    addCopies(map, findings);
    addProtective(map, findings);
    if (const GPTCopy* const valid = map.validCopy())
        addPartitions(map, *valid, findings);
    return findings;
}

bool isSameTable(const GPTHeader& a, const GPTHeader& b)
{
    return a.firstUsable == b.firstUsable && a.lastUsable == b.lastUsable && a.disk == b.disk &&
           a.entryCount == b.entryCount && a.entryBytes == b.entryBytes &&
           a.entriesChecksum == b.entriesChecksum && a.place == b.otherPlace &&
           a.otherPlace == b.place;
}

}  // namespace pellar
