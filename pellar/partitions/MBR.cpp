// SPDX-License-Identifier: Apache-2.0
#include "pellar/partitions/MBR.h"

#include <algorithm>
#include <set>
#include <string_view>

namespace pellar {
namespace {

constexpr std::size_t mostLogicalPartitions = 256;

bool hasText(ByteView sector, std::size_t offset, std::string_view text)
{
    return std::equal(text.begin(), text.end(),
                      sector.begin() + static_cast<std::ptrdiff_t>(offset));
}

// The jump, the name at byte 3, and for FAT its name at byte 54 or 82 (Microsoft's FAT and exFAT
// specifications). An MBR has its program there.
bool startsVolumeOf(ByteView sector)
{
    const bool startsWithJump = sector[0] == 0xEB || sector[0] == 0xE9;
    return startsWithJump && (hasText(sector, 3, "NTFS    ") || hasText(sector, 3, "EXFAT   ") ||
                              hasText(sector, 54, "FAT1") || hasText(sector, 82, "FAT32"));
}

MBREntry parseEntry(ByteView entry)
{
    return {entry[0], entry[4], static_cast<std::uint32_t>(littleEndian(entry, 8, 4)),
            static_cast<std::uint32_t>(littleEndian(entry, 12, 4))};
}

/// Follows the links of an extended partition: each is a boot sector with a logical partition,
/// counted from the link, and the next link, counted from the extended partition's start.
class ChainReader {
public:
    ChainReader(const Sectors& sectors, const MBRPartition& extended, MBRPartitions& result)
        : sectors_(sectors), extended_(extended), result_(result)
    {
    }

    void read()
    {
        std::uint64_t next = extended_.first;
        while (next != 0 && result_.chain == ChainFault::None)
            next = readLink(next);
    }

private:
    /// The next link's place; 0 behind the last.
    std::uint64_t readLink(std::uint64_t place)
    {
        const bool isInside = place >= extended_.first &&
                              place - extended_.first < extended_.count() &&
                              place < sectors_.count();
        if (!isInside)
            return fail(ChainFault::Outside);
        if (!seen_.insert(place).second)
            return fail(ChainFault::Loop);
        if (seen_.size() > mostLogicalPartitions)
            return fail(ChainFault::TooLong);
        const MBRSector link = readMBRSector(sectors_, place);
        if (!link.hasSignature)
            return fail(ChainFault::Broken);
        std::uint64_t next = 0;
        for (const MBREntry& entry : link.entries) {
            if (entry.isExtended() && next == 0)
                next = extended_.first + entry.start;
            else if (entry.isUsed() && !entry.isExtended())
                result_.partitions.push_back({nextNumber_++, entry, place + entry.start});
        }
        return next;
    }

    std::uint64_t fail(ChainFault fault)
    {
        result_.chain = fault;
        return 0;
    }

    const Sectors& sectors_;
    const MBRPartition extended_;
    MBRPartitions& result_;
    std::set<std::uint64_t> seen_;
    int nextNumber_ = 5;
};

}  // namespace

bool MBRSector::hasProtective() const
{
    return hasSignature && std::any_of(entries.begin(), entries.end(),
                                       [](const MBREntry& entry) { return entry.isProtective(); });
}

std::size_t MBRSector::ordinaryCount() const
{
    return static_cast<std::size_t>(std::count_if(
        entries.begin(), entries.end(),
        [](const MBREntry& entry) { return entry.isUsed() && !entry.isProtective(); }));
}

MBRSector readMBRSector(const Sectors& sectors, std::uint64_t place)
{
    MBRSector result;
    const auto sector = sectors.read(place, 1);
    if (!sector)
        return result;
    result.isReadable = true;
    result.hasSignature = (*sector)[510] == 0x55 && (*sector)[511] == 0xAA;
    result.startsVolume = startsVolumeOf(*sector);
    for (std::size_t i = 0; i < result.entries.size(); ++i)
        result.entries[i] = parseEntry(
            ByteView(*sector).subspan(mbrEntriesOffset + i * mbrEntryBytes, mbrEntryBytes));
    return result;
}

MBRPartitions readMBRPartitions(const Sectors& sectors, const MBRSector& boot)
{
    MBRPartitions result;
    for (std::size_t i = 0; i < boot.entries.size(); ++i)
        if (boot.entries[i].isUsed())
            result.partitions.push_back(
                {static_cast<int>(i) + 1, boot.entries[i], boot.entries[i].start});
    const std::vector<MBRPartition> primaries = result.partitions;
    for (const MBRPartition& partition : primaries)
        if (partition.entry.isExtended() && ++result.extendedCount == 1)
            ChainReader(sectors, partition, result).read();
    return result;
}

}  // namespace pellar
