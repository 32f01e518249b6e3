// SPDX-License-Identifier: Apache-2.0
#include "pellar/volumes/NtfsBootSector.h"

namespace pellar {
namespace {

constexpr std::size_t protectedBytes = 512;

/// "clusters per record": a number of clusters, or, when negative, the exponent of a number of
/// bytes.
std::uint64_t recordBytesFrom(std::uint8_t field, std::uint64_t clusterBytes)
{
    const int exponent = 256 - field;
    if (field < 0x80)
        return field * clusterBytes;
    return exponent < 32 ? std::uint64_t{1} << exponent : 0;
}

/// The last two bytes of each 512 are kept in the record's head while it is on the disk. NO when
/// the record was not written as a whole.
bool undoProtection(std::vector<std::uint8_t>& record)
{
    const std::size_t array = littleEndian(record, 4, 2);
    const std::size_t count = littleEndian(record, 6, 2);
    if (count != record.size() / protectedBytes + 1 || array + count * 2 > protectedBytes)
        return false;
    for (std::size_t i = 1; i < count; ++i) {
        const std::size_t end = i * protectedBytes - 2;
        if (record[end] != record[array] || record[end + 1] != record[array + 1])
            return false;
        record[end] = record[array + 2 * i];
        record[end + 1] = record[array + 2 * i + 1];
    }
    return true;
}

/// The value of a resident attribute; empty when the record has none of this type.
Bytes attributeValue(Bytes record, std::uint32_t type)
{
    constexpr std::uint32_t endOfAttributes = 0xFFFFFFFF;
    constexpr std::size_t headBytes = 24;
    std::size_t at = littleEndian(record, 20, 2);
    while (at + headBytes <= record.size()) {
        const std::uint64_t found = littleEndian(record, at, 4);
        const std::uint64_t length = littleEndian(record, at + 4, 4);
        if (found == endOfAttributes || length < headBytes || length > record.size() - at)
            break;
        const std::uint64_t valueBytes = littleEndian(record, at + 16, 4);
        const std::uint64_t value = littleEndian(record, at + 20, 2);
        if (found == type && record[at + 8] == 0 && value + valueBytes <= length)
            return record.subspan(at + value, valueBytes);
        at += length;
    }
    return {};
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
    if (recordBytes < protectedBytes || recordBytes > 65536 || !isPowerOfTwo(recordBytes))
        return std::nullopt;
    NtfsBootSector sector;
    sector.sectorBytes = static_cast<std::uint32_t>(sectorBytes);
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

std::optional<bool> isNtfsMarkedDirty(int descriptor, std::uint64_t offset,
                                      const NtfsBootSector& sector)
{
    constexpr std::uint64_t volumeRecord = 3;
    constexpr std::uint32_t volumeInformation = 0x70;
    constexpr std::uint64_t dirty = 1;
    if (sector.fileTablePlace > sector.volumeBytes)
        return std::nullopt;
    auto record =
        readDisk(descriptor, offset + sector.fileTablePlace + volumeRecord * sector.fileRecordBytes,
                 sector.fileRecordBytes);
    if (!record || !holdsText(*record, 0, "FILE") || !undoProtection(*record))
        return std::nullopt;
    const Bytes information = attributeValue(*record, volumeInformation);
    if (information.size() < 12)
        return std::nullopt;
    return (littleEndian(information, 10, 2) & dirty) != 0;
}

}  // namespace pellar
