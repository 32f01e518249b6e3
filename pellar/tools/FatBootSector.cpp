// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/FatBootSector.h"

namespace pellar {
namespace {

/// The fields that FAT12, FAT16 and FAT32 share.
struct Geometry {
    std::uint64_t sectorBytes;
    std::uint64_t sectorsPerCluster;
    std::uint64_t reservedSectors;
    std::uint64_t tables;
    std::uint64_t rootEntries;
    std::uint64_t sectors;
    std::uint64_t sectorsPerTable;
    bool isLarge;  ///< the table's size stands where FAT32 has it

    std::uint64_t sectorsBeforeData() const
    {
        constexpr std::uint64_t entryBytes = 32;
        const std::uint64_t rootSectors =
            (rootEntries * entryBytes + sectorBytes - 1) / sectorBytes;
        return reservedSectors + tables * sectorsPerTable + rootSectors;
    }
    std::uint64_t clusters() const { return (sectors - sectorsBeforeData()) / sectorsPerCluster; }
};

Geometry geometryOf(Bytes bytes)
{
    const std::uint64_t smallSectors = littleEndian(bytes, 19, 2);
    const std::uint64_t smallTable = littleEndian(bytes, 22, 2);
    return {littleEndian(bytes, 11, 2),
            bytes[13],
            littleEndian(bytes, 14, 2),
            bytes[16],
            littleEndian(bytes, 17, 2),
            smallSectors != 0 ? smallSectors : littleEndian(bytes, 32, 4),
            smallTable != 0 ? smallTable : littleEndian(bytes, 36, 4),
            smallTable == 0};
}

bool makesSense(const Geometry& geometry)
{
    const bool hasSizes = isPowerOfTwo(geometry.sectorBytes) && geometry.sectorBytes >= 512 &&
                          geometry.sectorBytes <= 4096 && isPowerOfTwo(geometry.sectorsPerCluster);
    return hasSizes && geometry.reservedSectors > 0 && geometry.tables >= 1 &&
           geometry.tables <= 2 && geometry.sectorsPerTable > 0 &&
           (geometry.isLarge == (geometry.rootEntries == 0)) &&
           geometry.sectors > geometry.sectorsBeforeData();
}

bool hasSignature(Bytes bytes)
{
    const bool isJump = bytes[0] == 0xEB || bytes[0] == 0xE9;
    const bool isMedia = bytes[21] >= 0xF8 || bytes[21] == 0xF0;
    return isJump && isMedia && littleEndian(bytes, 510, 2) == 0xAA55;
}

// The number of clusters alone tells the kinds apart.
int bitsFor(const Geometry& geometry)
{
    constexpr std::uint64_t mostOf12 = 4084;
    if (geometry.isLarge)
        return 32;
    return geometry.clusters() <= mostOf12 ? 12 : 16;
}

}  // namespace

std::optional<FatBootSector> parseFatBootSector(Bytes bytes)
{
    if (bytes.size() < FatBootSector::size || !hasSignature(bytes))
        return std::nullopt;
    const Geometry geometry = geometryOf(bytes);
    if (!makesSense(geometry))
        return std::nullopt;
    FatBootSector sector;
    sector.bits = bitsFor(geometry);
    sector.volumeBytes = geometry.sectors * geometry.sectorBytes;
    // Bit 0 of the byte behind the drive number.
    sector.isMarkedDirty = (bytes[sector.bits == 32 ? 0x41 : 0x25] & 1U) != 0;
    return sector;
}

std::optional<FatBootSector> readFatBootSector(int descriptor, std::uint64_t offset,
                                               std::uint64_t availableBytes)
{
    constexpr std::uint64_t backupPlace = 6 * 512;
    if (availableBytes < backupPlace + FatBootSector::size)
        return std::nullopt;
    if (const auto bytes = readDisk(descriptor, offset, FatBootSector::size))
        if (const auto sector = parseFatBootSector(*bytes))
            return sector;
    const auto bytes = readDisk(descriptor, offset + backupPlace, FatBootSector::size);
    auto backup = bytes ? parseFatBootSector(*bytes) : std::nullopt;
    if (!backup || backup->bits != 32)
        return std::nullopt;
    backup->isBackup = true;
    return backup;
}

}  // namespace pellar
