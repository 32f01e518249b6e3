// SPDX-License-Identifier: Apache-2.0
#include "pellar/partitions/PartitionMap.h"

#include "pellar/bytes/Checksums.h"

#include <algorithm>
#include <utility>

namespace pellar {
namespace {

/// Notes what is on the disk and cannot be read all the same.
class NotingSectors final : public Sectors {
public:
    NotingSectors(const Sectors& sectors, std::optional<std::uint64_t>& unreadable)
        : sectors_(sectors), unreadable_(unreadable)
    {
    }

    std::uint32_t sectorBytes() const override { return sectors_.sectorBytes(); }
    std::uint64_t count() const override { return sectors_.count(); }
    std::optional<Bytes> read(std::uint64_t first, std::uint64_t number) const override
    {
        auto bytes = sectors_.read(first, number);
        if (!bytes && !unreadable_ && isOnDisk(first, number, count()))
            unreadable_ = firstUnreadable(first, number);
        return bytes;
    }

private:
    std::uint64_t firstUnreadable(std::uint64_t first, std::uint64_t number) const
    {
        for (std::uint64_t i = 0; i < number; ++i)
            if (!sectors_.read(first + i, 1))
                return first + i;
        return first;
    }

    const Sectors& sectors_;
    std::optional<std::uint64_t>& unreadable_;
};

GPTCopy readCopy(const Sectors& sectors, std::uint64_t place)
{
    GPTCopy copy;
    copy.header = readHeader(sectors, place);
    if (copy.header.fault != HeaderFault::None)
        return copy;
    const GPTHeader& header = copy.header.header;
    auto entries = sectors.read(header.entriesPlace, header.entriesSectors(sectors.sectorBytes()));
    if (!entries) {
        copy.entriesFault = GPTCopy::EntriesFault::Unreadable;
        return copy;
    }
    entries->resize(header.entriesLength());
    const bool isRight = crc32(*entries) == header.entriesChecksum;
    copy.entriesFault =
        isRight ? GPTCopy::EntriesFault::None : GPTCopy::EntriesFault::WrongChecksum;
    if (isRight)
        copy.entries = *std::move(entries);
    return copy;
}

/// Where the backup may stand: where the primary says, at the end of the disk, and where the end
/// was when the protective entry was written.
std::vector<std::uint64_t> backupPlaces(const PartitionMap& map)
{
    std::vector<std::uint64_t> places;
    const auto add = [&](std::uint64_t place) {
        const bool isNew = std::find(places.begin(), places.end(), place) == places.end();
        if (isNew && place > primaryHeaderPlace && place < map.sectorCount)
            places.push_back(place);
    };
    if (map.primary.header.fault == HeaderFault::None)
        add(map.primary.header.header.otherPlace);
    add(map.lastSector());
    for (const MBREntry& entry : map.boot.entries)
        if (map.boot.hasSignature && entry.isProtective())
            add(std::uint64_t{entry.start} + entry.count - 1);
    return places;
}

// The first that is good; else the first that is there at all, so that its fault can be told.
void readBackup(PartitionMap& map, const Sectors& sectors)
{
    map.backupPlace = map.lastSector();
    bool isFound = false;
    for (const std::uint64_t place : backupPlaces(map)) {
        GPTCopy copy = readCopy(sectors, place);
        if (!copy.isGood() && (isFound || !copy.header.hasSignature()))
            continue;
        const bool isGood = copy.isGood();
        map.backup = std::move(copy);
        map.backupPlace = place;
        isFound = true;
        if (isGood)
            return;
    }
    if (!isFound)
        map.backup = readCopy(sectors, map.backupPlace);
}

PartitionMap::Kind kindOf(const PartitionMap& map)
{
    const bool isTable = map.boot.hasSignature && !map.boot.startsVolume;
    const bool isFilled = !map.wholeSignature.empty();
    if (isTable && map.boot.hasProtective())
        return PartitionMap::Kind::GPT;
    if (isTable && map.boot.ordinaryCount() > 0)
        return PartitionMap::Kind::MBR;
    // What fills the disk has taken the place of the map; a header that is left is a remnant.
    if (isFilled || map.boot.startsVolume)
        return PartitionMap::Kind::None;
    if (map.primary.header.hasSignature() || map.backup.header.hasSignature())
        return PartitionMap::Kind::GPT;
    return isTable ? PartitionMap::Kind::MBR : PartitionMap::Kind::None;
}

}  // namespace

const GPTCopy* PartitionMap::validCopy() const
{
    if (primary.isGood())
        return &primary;
    return backup.isGood() ? &backup : nullptr;
}

bool PartitionMap::hasCopiesInPlace() const
{
    return primary.isGood() && backup.isGood() && backupPlace == lastSector();
}

PartitionMap readPartitionMap(const Sectors& disk, std::string wholeSignature)
{
    constexpr std::uint64_t fewestSectors = 2;
    PartitionMap map;
    const NotingSectors sectors(disk, map.unreadableSector);
    map.sectorBytes = sectors.sectorBytes();
    map.sectorCount = sectors.count();
    map.wholeSignature = std::move(wholeSignature);
    if (map.sectorCount < fewestSectors)
        return map;
    map.boot = readMBRSector(sectors, 0);
    map.primary = readCopy(sectors, primaryHeaderPlace);
    readBackup(map, sectors);
    map.kind = kindOf(map);
    if (map.kind == PartitionMap::Kind::MBR)
        map.mbr = readMBRPartitions(sectors, map.boot);
    return map;
}

bool hasGPTHeader(const Sectors& sectors)
{
    if (sectors.count() < 2)
        return false;
    return readHeader(sectors, primaryHeaderPlace).hasSignature() ||
           readHeader(sectors, sectors.count() - 1).hasSignature();
}

}  // namespace pellar
