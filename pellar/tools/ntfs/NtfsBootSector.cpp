// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/ntfs/NtfsBootSector.h"

namespace pellar {
namespace {

/// "clusters per record": a number of clusters, or, when negative, the exponent of a number of
/// bytes.
std::uint64_t recordBytesFrom(std::uint8_t field, std::uint64_t clusterBytes)
{
    const int exponent = 256 - field;
    if (field < 0x80)
        return field * clusterBytes;
    return exponent < 32 ? std::uint64_t{1} << exponent : 0;
}

std::optional<NtfsBootSector> readAt(int descriptor, std::uint64_t place)
{
    const auto bytes = readDisk(descriptor, place, NtfsBootSector::size);
    return bytes ? parseNtfsBootSector(*bytes) : std::nullopt;
}

}  // namespace

std::optional<NtfsBootSector> parseNtfsBootSector(Bytes bytes)
{
    if (bytes.size() < NtfsBootSector::size || !holdsText(bytes, 3, "NTFS    "))
        return std::nullopt;
    const std::uint64_t sectorBytes = littleEndian(bytes, 11, 2);
    const std::uint64_t sectors = littleEndian(bytes, 40, 8);
    // Beyond 128 a cluster's size is the exponent of a number of sectors.
    const unsigned field = bytes[13];
    const std::uint64_t clusterSectors =
        field <= 128 ? field : (field >= 0xF0 ? std::uint64_t{1} << (256 - field) : 0);
    if (!isPowerOfTwo(sectorBytes) || sectorBytes < 256 || sectorBytes > 4096 ||
        !isPowerOfTwo(clusterSectors) || sectors == 0)
        return std::nullopt;
    const std::uint64_t clusterBytes = sectorBytes * clusterSectors;
    const std::uint64_t recordBytes = recordBytesFrom(bytes[64], clusterBytes);
    if (recordBytes < 512 || recordBytes > 65536 || !isPowerOfTwo(recordBytes))
        return std::nullopt;
    NtfsBootSector sector;
    sector.sectorBytes = static_cast<std::uint32_t>(sectorBytes);
    sector.clusterBytes = clusterBytes;
    const std::uint64_t withoutBackup = productOrGreatest(sectors, sectorBytes);
    sector.volumeBytes =
        withoutBackup + sectorBytes < withoutBackup ? withoutBackup : withoutBackup + sectorBytes;
    sector.fileTablePlace = productOrGreatest(littleEndian(bytes, 48, 8), clusterBytes);
    sector.fileRecordBytes = static_cast<std::uint32_t>(recordBytes);
    return sector;
}

std::optional<NtfsBootSector> readNtfsBootSector(int descriptor, std::uint64_t offset,
                                                 std::uint64_t availableBytes)
{
    if (availableBytes < NtfsBootSector::size)
        return std::nullopt;
    if (const auto sector = readAt(descriptor, offset))
        return sector;
    auto backup = readAt(descriptor, offset + availableBytes - NtfsBootSector::size);
    if (backup)
        backup->isBackup = true;
    return backup;
}

bool differsFromNtfsBackup(int descriptor, std::uint64_t offset, const NtfsBootSector& sector)
{
    const auto bytes = readDisk(descriptor, offset + sector.volumeBytes - sector.sectorBytes,
                                NtfsBootSector::size);
    return bytes && parseNtfsBootSector(*bytes) != sector;
}

}  // namespace pellar
