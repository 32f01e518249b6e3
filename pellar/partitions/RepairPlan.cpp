// SPDX-License-Identifier: Apache-2.0
#include "pellar/partitions/RepairPlan.h"

#include <algorithm>
#include <array>
#include <limits>
#include <optional>
#include <utility>

namespace pellar {
namespace {

/// Both headers as they have to be.
struct Target {
    GPTHeader primary;
    GPTHeader backup;
};

/// Where the primary list of partitions stands although its header is gone: some boards keep their
/// loader at sector 2 and the list behind it. Sector 2 where it is nowhere to be found.
std::uint64_t primaryEntriesPlace(const PartitionMap& map, const GPTCopy& valid,
                                  const Sectors& sectors)
{
    constexpr std::uint64_t usual = 2;
    constexpr std::uint64_t mostSearched = 4096;
    if (map.primary.header.fault == HeaderFault::None)
        return map.primary.header.header.entriesPlace;
    const std::uint64_t end = std::min(valid.header.header.firstUsable, mostSearched);
    const auto before = end > usual ? sectors.read(usual, end - usual) : std::nullopt;
    if (!before)
        return usual;
    for (std::size_t at = 0; at + valid.entries.size() <= before->size(); at += map.sectorBytes)
        if (std::equal(valid.entries.begin(), valid.entries.end(),
                       before->begin() + static_cast<std::ptrdiff_t>(at)))
            return usual + at / map.sectorBytes;
    return usual;
}

std::uint64_t backupEntriesPlace(const PartitionMap& map, std::uint64_t length)
{
    const bool isInPlace = map.backup.header.fault == HeaderFault::None &&
                           map.backup.header.header.place == map.lastSector() &&
                           map.backup.header.header.entriesSectors(map.sectorBytes) == length;
    return isInPlace ? map.backup.header.header.entriesPlace : map.lastSector() - length;
}

/// None where there is no room for it in front of, or behind, the usable sectors.
std::optional<Target> targetFor(const PartitionMap& map, const GPTCopy& valid,
                                const MapReport& report, const Sectors& sectors)
{
    const GPTHeader& source = valid.header.header;
    const std::uint64_t length = source.entriesSectors(map.sectorBytes);
    if (map.lastSector() <= length)
        return std::nullopt;
    Target target{source, source};
    target.primary.place = primaryHeaderPlace;
    target.primary.otherPlace = map.lastSector();
    target.primary.entriesPlace = primaryEntriesPlace(map, valid, sectors);
    target.backup.place = map.lastSector();
    target.backup.otherPlace = primaryHeaderPlace;
    target.backup.entriesPlace = backupEntriesPlace(map, length);
    if (report.has(FindingKind::BackupNotAtEnd))
        target.primary.lastUsable = target.backup.lastUsable = target.backup.entriesPlace - 1;
    const bool hasRoom = target.primary.entriesPlace < source.firstUsable &&
                         length <= source.firstUsable - target.primary.entriesPlace &&
                         target.backup.entriesPlace > target.backup.lastUsable &&
                         target.backup.lastUsable >= source.lastUsable;
    return hasRoom ? std::optional(target) : std::nullopt;
}

Bytes wholeSectors(Bytes bytes, std::uint32_t sectorBytes)
{
    bytes.resize((bytes.size() + sectorBytes - 1) / sectorBytes * sectorBytes);
    return bytes;
}

/// Only the size and place of the protective entry are set where there is one; the boot program
/// stays in any case.
Bytes protectiveSector(const Bytes& before, const PartitionMap& map)
{
    constexpr std::size_t startOffset = 8;
    Bytes sector = before;
    auto entry = std::find_if(map.boot.entries.begin(), map.boot.entries.end(),
                              [](const MBREntry& e) { return e.isProtective(); });
    const bool isThere = map.boot.hasProtective();
    const auto index = isThere ? entry - map.boot.entries.begin() : 0;
    std::uint8_t* const at =
        sector.data() + mbrEntriesOffset + static_cast<std::size_t>(index) * mbrEntryBytes;
    if (!isThere) {
        // Cylinder 0, head 0, sector 2 to the greatest that can be written.
        constexpr std::array<std::uint8_t, 8> begin{0, 0, 2, 0, 0xEE, 0xFF, 0xFF, 0xFF};
        std::fill(sector.begin() + mbrEntriesOffset, sector.begin() + 510, std::uint8_t{0});
        std::copy(begin.begin(), begin.end(), at);
        sector[510] = 0x55;
        sector[511] = 0xAA;
    }
    constexpr std::uint64_t greatest = std::numeric_limits<std::uint32_t>::max();
    const std::span bytes(at, mbrEntryBytes);
    putLittleEndian(bytes, startOffset, 4, 1);
    putLittleEndian(bytes, startOffset + 4, 4, std::min(map.lastSector(), greatest));
    return sector;
}

/// Gathers what differs from what stands on the disk.
class PlanWriter {
public:
    PlanWriter(const PartitionMap& map, const GPTCopy& valid, const Sectors& sectors)
        : map_(map), valid_(valid), sectors_(sectors)
    {
    }

    void addCopy(const GPTHeader& header, std::string_view entriesWhat, std::string_view headerWhat)
    {
        add(header.entriesPlace, wholeSectors(valid_.entries, map_.sectorBytes), entriesWhat);
        add(header.place, headerSector(valid_.header.sector, header), headerWhat);
    }

    void addProtective()
    {
        if (const auto before = sectors_.read(0, 1))
            add(0, protectiveSector(*before, map_), "Writing the protective MBR");
        else
            isReadable_ = false;
    }

    bool isReadable() const { return isReadable_; }
    RepairPlan take() { return std::move(plan_); }

private:
    void add(std::uint64_t first, Bytes after, std::string_view what)
    {
        const auto before = sectors_.read(first, after.size() / map_.sectorBytes);
        if (!before)
            isReadable_ = false;
        else if (*before != after)
            plan_.writes.push_back({first, std::move(after), what});
    }

    const PartitionMap& map_;
    const GPTCopy& valid_;
    const Sectors& sectors_;
    RepairPlan plan_;
    bool isReadable_ = true;
};

bool touchesPartition(const RepairPlan& plan, const PartitionMap& map, const GPTCopy& valid)
{
    const auto entries = usedEntries(valid.entries, valid.header.header);
    return std::any_of(plan.writes.begin(), plan.writes.end(), [&](const SectorWrite& write) {
        const std::uint64_t last = write.first + write.after.size() / map.sectorBytes - 1;
        return std::any_of(entries.begin(), entries.end(), [&](const GPTEntry& entry) {
            return entry.first <= last && write.first <= entry.last;
        });
    });
}

bool mendsProtective(const MapReport& report)
{
    return report.has(FindingKind::ProtectiveMissing) ||
           report.has(FindingKind::ProtectiveWrongSize) ||
           report.has(FindingKind::ProtectiveWrongStart);
}

}  // namespace

std::optional<Bytes> PlannedSectors::read(std::uint64_t first, std::uint64_t number) const
{
    auto bytes = disk_.read(first, number);
    if (!bytes)
        return std::nullopt;
    const std::uint32_t size = sectorBytes();
    for (const SectorWrite& write : plan_.writes) {
        const std::uint64_t writeEnd = write.first + write.after.size() / size;
        const std::uint64_t from = std::max(first, write.first);
        const std::uint64_t end = std::min(first + number, writeEnd);
        if (from < end)
            std::copy_n(
                write.after.begin() + static_cast<std::ptrdiff_t>((from - write.first) * size),
                (end - from) * size,
                bytes->begin() + static_cast<std::ptrdiff_t>((from - first) * size));
    }
    return bytes;
}

Result<RepairPlan, Sentence> planRepair(const PartitionMap& map, const MapReport& report,
                                        const Sectors& sectors)
{
    const GPTCopy* const valid = map.validCopy();
    if (report.verdict != MapVerdict::Repairable || valid == nullptr)
        return Sentence{"there is no valid copy to restore it from", {}, {}};
    const auto target = targetFor(map, *valid, report, sectors);
    if (!target)
        return Sentence{"there is no room for a second copy beside the partitions", {}, {}};
    PlanWriter writer(map, *valid, sectors);
    writer.addCopy(target->primary, "Writing the list of partitions of the main copy",
                   "Writing the header of the main copy");
    writer.addCopy(target->backup, "Writing the list of partitions of the backup copy",
                   "Writing the header of the backup copy");
    if (mendsProtective(report))
        writer.addProtective();
    if (!writer.isReadable())
        return Sentence{"the sectors that would be written cannot be read", {}, {}};
    RepairPlan plan = writer.take();
    if (touchesPartition(plan, map, *valid))
        return Sentence{"it would overwrite a part of a partition", {}, {}};
    return plan;
}

}  // namespace pellar
