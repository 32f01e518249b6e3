// SPDX-License-Identifier: Apache-2.0
#include "pellar/partitions/Finding.h"

#include "contract/foundation/UTF8.h"

#include <algorithm>
#include <array>
#include <tuple>

namespace pellar {
namespace {

struct KnownFinding {
    FindingKind kind;
    FindingLevel level;
    std::string_view text;
};

using enum FindingKind;
using enum FindingLevel;

constexpr std::array findings{
    KnownFinding{PrimaryUnreadable, Repairable,
                 "The main copy of the partition map cannot be read."},
    KnownFinding{PrimaryMissing, Repairable, "The main copy of the partition map is missing."},
    KnownFinding{PrimaryHeaderChecksum, Repairable,
                 "The header of the partition map's main copy is damaged: its checksum is wrong."},
    KnownFinding{PrimaryHeaderNumbers, Repairable,
                 "The header of the partition map's main copy is damaged: its numbers make no "
                 "sense."},
    KnownFinding{PrimaryEntriesChecksum, Repairable,
                 "The list of partitions in the main copy is damaged: its checksum is wrong."},
    KnownFinding{BackupUnreadable, Repairable,
                 "The backup copy of the partition map cannot be read."},
    KnownFinding{BackupMissing, Repairable, "The backup copy of the partition map is missing."},
    KnownFinding{BackupHeaderChecksum, Repairable,
                 "The header of the partition map's backup copy is damaged: its checksum is "
                 "wrong."},
    KnownFinding{BackupHeaderNumbers, Repairable,
                 "The header of the partition map's backup copy is damaged: its numbers make no "
                 "sense."},
    KnownFinding{BackupEntriesChecksum, Repairable,
                 "The list of partitions in the backup copy is damaged: its checksum is wrong."},
    KnownFinding{BackupNotAtEnd, Repairable,
                 "The backup copy of the partition map is not at the end of the disk: the disk has "
                 "grown. Sectors behind it: %1$@."},
    KnownFinding{CopiesDiffer, Repairable, "The two copies of the partition map differ."},
    KnownFinding{NoValidCopy, NeedsPerson, "Neither copy of the partition map is valid."},
    KnownFinding{DiskCut, NeedsPerson,
                 "The disk is shorter than its partition map says: the map was made for %1$@ "
                 "sectors, but only %2$@ are there."},
    KnownFinding{DiskFilled, NeedsPerson,
                 "The disk also bears the mark of something that fills the whole of it: %1$@."},
    KnownFinding{ProtectiveMissing, Repairable, "The protective MBR is missing."},
    KnownFinding{ProtectiveWrongSize, Repairable, "The protective MBR states a wrong size."},
    KnownFinding{ProtectiveWrongStart, Repairable,
                 "The protective MBR does not begin where it should."},
    KnownFinding{ProtectiveReplaced, NeedsPerson,
                 "Two maps contradict each other: a GUID partition table in good order, and an MBR "
                 "with one partition over the whole disk in place of the protective one."},
    KnownFinding{Hybrid, Note,
                 "The disk has a hybrid MBR: some partitions are listed there as well. It is left "
                 "as it is."},
    KnownFinding{Remnants, Note,
                 "Remnants of an older partition map (GPT) are on the disk; the MBR counts."},
    KnownFinding{EndBeforeStart, NeedsPerson,
                 "Partition %3$@ ends before it starts (sector %1$@ to sector %2$@)."},
    KnownFinding{BeyondDisk, NeedsPerson,
                 "Partition %3$@ reaches beyond the end of the disk (to sector %1$@; the last is "
                 "%2$@)."},
    KnownFinding{OutsideUsable, NeedsPerson,
                 "Partition %3$@ lies outside of the sectors that the map allows (%1$@ to %2$@)."},
    KnownFinding{Overlap, NeedsPerson, "Partitions %1$@ and %2$@ overlap."},
    KnownFinding{SameIdentifier, NeedsPerson,
                 "Partitions %1$@ and %2$@ have the same unique identifier."},
    KnownFinding{StartsAtMap, NeedsPerson,
                 "Partition %1$@ starts where the partition map itself stands."},
    KnownFinding{EmptyPartition, NeedsPerson, "Partition %1$@ has no sectors."},
    KnownFinding{OutsideExtended, NeedsPerson,
                 "The logical partition %1$@ lies outside of the extended partition."},
    KnownFinding{BadBootFlag, NeedsPerson,
                 "The boot flag of partition %1$@ is neither on nor off."},
    KnownFinding{TwoActive, NeedsPerson, "Partitions %1$@ and %2$@ are both marked active."},
    KnownFinding{SeveralExtended, NeedsPerson, "There is more than one extended partition."},
    KnownFinding{ChainBroken, NeedsPerson,
                 "The chain of logical partitions is broken; there may be more of them."},
    KnownFinding{ChainOutside, NeedsPerson,
                 "The chain of logical partitions leads out of the extended partition."},
    KnownFinding{ChainLoop, NeedsPerson, "The chain of logical partitions runs in a circle."},
    KnownFinding{ChainTooLong, NeedsPerson,
                 "The chain of logical partitions is too long to be true."},
    KnownFinding{More, Note, "… and more problems of the partition map: %1$@"},
};

const KnownFinding& known(FindingKind kind)
{
    return *std::find_if(findings.begin(), findings.end(),
                         [kind](const KnownFinding& finding) { return finding.kind == kind; });
}

static_assert([] {
    for (std::size_t i = 0; i < findings.size(); ++i)
        if (static_cast<std::size_t>(findings[i].kind) != i)
            return false;
    return findings.size() == static_cast<std::size_t>(More) + 1;
}());

}  // namespace

FindingLevel levelOf(FindingKind kind)
{
    return known(kind).level;
}

std::string_view textOf(FindingKind kind)
{
    return known(kind).text;
}

// A name like "%2$@" must not be taken for a place that the next argument fills.
std::string partitionLabel(std::uint64_t number, const std::string& name)
{
    std::string shown = contract::printable(name);
    std::replace(shown.begin(), shown.end(), '%', ' ');
    return std::to_string(number) + (shown.empty() ? "" : " “" + shown + "”");
}

void findOverlaps(std::vector<Extent> extents, std::vector<Finding>& findings)
{
    std::stable_sort(extents.begin(), extents.end(), [](const Extent& a, const Extent& b) {
        return std::tie(a.first, a.last) < std::tie(b.first, b.last);
    });
    const Extent* reaching = nullptr;  // of those before, the one that ends last
    for (const Extent& extent : extents) {
        if (reaching != nullptr && extent.first <= reaching->last)
            findings.push_back({FindingKind::Overlap, {reaching->label, extent.label}});
        if (reaching == nullptr || extent.last > reaching->last)
            reaching = &extent;
    }
}

}  // namespace pellar
