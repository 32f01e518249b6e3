// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/ntfs/NtfsVolume.h"

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

std::optional<NtfsBootSector> parseNtfsBootSector(ByteView bytes)
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

std::optional<NtfsBootSector> readAt(int descriptor, std::uint64_t place)
{
    const auto bytes = readDisk(descriptor, place, NtfsBootSector::size);
    return bytes ? parseNtfsBootSector(*bytes) : std::nullopt;
}

/// An attribute of a file's record; it points into the record.
struct NtfsAttribute {
    bool isResident = false;
    ByteView bytes;  ///< from its head on
    ByteView value;  ///< of a resident one
};

constexpr std::size_t protectedBytes = 512;

/// The value lies within the attribute, or is empty.
ByteView valueOf(ByteView attribute)
{
    const std::uint64_t length = littleEndian(attribute, 16, 4);
    const std::uint64_t start = littleEndian(attribute, 20, 2);
    return start + length <= attribute.size() ? attribute.subspan(start, length) : ByteView();
}

/// Undoes the protection of a block that begins with it: the last two bytes of each 512 are kept
/// in its head while it is on the disk. NO when it was not written as a whole.
bool undoNtfsProtection(Bytes& block)
{
    const std::size_t array = littleEndian(block, 4, 2);
    const std::size_t count = littleEndian(block, 6, 2);
    if (count != block.size() / protectedBytes + 1 || array + count * 2 > protectedBytes)
        return false;
    for (std::size_t i = 1; i < count; ++i) {
        const std::size_t end = i * protectedBytes - 2;
        if (block[end] != block[array] || block[end + 1] != block[array + 1])
            return false;
        block[end] = block[array + 2 * i];
        block[end + 1] = block[array + 2 * i + 1];
    }
    return true;
}

/// A record of the master file table, with its protection against half a write undone. None when
/// it cannot be read or was not written as a whole. Only the first records, which the system keeps
/// for itself and in one piece, are found so.
std::optional<Bytes> readNtfsRecord(int descriptor, std::uint64_t offset,
                                    const NtfsBootSector& sector, std::uint64_t number)
{
    if (sector.fileTablePlace > sector.volumeBytes)
        return std::nullopt;
    auto record =
        readDisk(descriptor, offset + sector.fileTablePlace + number * sector.fileRecordBytes,
                 sector.fileRecordBytes);
    if (!record || !holdsText(*record, 0, "FILE") || !undoNtfsProtection(*record))
        return std::nullopt;
    return record;
}

/// The first attribute of this type; none when the record has none.
std::optional<NtfsAttribute> findNtfsAttribute(ByteView record, std::uint32_t type)
{
    constexpr std::uint32_t endOfAttributes = 0xFFFFFFFF;
    constexpr std::size_t headBytes = 24;
    std::size_t at = littleEndian(record, 20, 2);
    while (at + headBytes <= record.size()) {
        const std::uint64_t found = littleEndian(record, at, 4);
        const std::uint64_t length = littleEndian(record, at + 4, 4);
        if (found == endOfAttributes || length < headBytes || length > record.size() - at)
            return std::nullopt;
        const ByteView bytes = record.subspan(at, length);
        const bool isResident = bytes[8] == 0;
        if (found == type)
            return NtfsAttribute{isResident, bytes, isResident ? valueOf(bytes) : ByteView()};
        at += length;
    }
    return std::nullopt;
}

constexpr std::uint64_t journalRecord = 2;
constexpr std::uint64_t volumeRecord = 3;
constexpr std::uint32_t volumeInformation = 0x70;
constexpr std::uint32_t data = 0x80;
constexpr std::size_t pageBytes = 4096;

/// Where the first piece of a file lies, bytes from the start of the volume. The pieces follow each
/// other as pairs of numbers, whose widths stand in a byte before them.
std::optional<std::uint64_t> placeOfFirstPiece(ByteView attribute, std::uint64_t clusterBytes)
{
    constexpr std::size_t headBytes = 64;
    if (attribute.size() < headBytes)
        return std::nullopt;
    const std::uint64_t list = littleEndian(attribute, 32, 2);
    if (list >= attribute.size())
        return std::nullopt;
    const std::size_t lengthWidth = attribute[list] & 0xFU;
    const std::size_t placeWidth = attribute[list] >> 4U;
    if (lengthWidth == 0 || placeWidth == 0 || lengthWidth > 8 || placeWidth > 8 ||
        list + 1 + lengthWidth + placeWidth > attribute.size())
        return std::nullopt;
    return productOrGreatest(littleEndian(attribute, list + 1 + lengthWidth, placeWidth),
                             clusterBytes);
}

struct RestartPage {
    std::uint64_t sequence = 0;
    bool isWaiting = false;
};

std::optional<RestartPage> readRestartPage(int descriptor, std::uint64_t place)
{
    constexpr std::uint64_t noClient = 0xFFFF;
    constexpr std::uint64_t volumeIsClean = 2;
    constexpr std::size_t areaBytes = 16;
    auto page = readDisk(descriptor, place, pageBytes);
    if (!page || !holdsText(*page, 0, "RSTR") || !undoNtfsProtection(*page))
        return std::nullopt;
    const std::uint64_t area = littleEndian(*page, 24, 2);
    if (area + areaBytes > page->size())
        return std::nullopt;
    const bool hasClient = littleEndian(*page, area + 12, 2) != noClient;
    const bool isClean = (littleEndian(*page, area + 14, 2) & volumeIsClean) != 0;
    return RestartPage{littleEndian(*page, area, 8), hasClient && !isClean};
}

}  // namespace

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

std::optional<bool> isNtfsMarkedDirty(int descriptor, std::uint64_t offset,
                                      const NtfsBootSector& sector)
{
    constexpr std::uint64_t dirty = 1;
    const auto record = readNtfsRecord(descriptor, offset, sector, volumeRecord);
    const auto attribute = record ? findNtfsAttribute(*record, volumeInformation) : std::nullopt;
    if (!attribute || attribute->value.size() < 12)
        return std::nullopt;
    return (littleEndian(attribute->value, 10, 2) & dirty) != 0;
}

std::optional<bool> hasNtfsJournalWaiting(int descriptor, std::uint64_t offset,
                                          const NtfsBootSector& sector)
{
    const auto record = readNtfsRecord(descriptor, offset, sector, journalRecord);
    const auto attribute = record ? findNtfsAttribute(*record, data) : std::nullopt;
    if (!attribute || attribute->isResident)
        return std::nullopt;
    const auto place = placeOfFirstPiece(attribute->bytes, sector.clusterBytes);
    if (!place || *place >= sector.volumeBytes)
        return std::nullopt;
    const auto first = readRestartPage(descriptor, offset + *place);
    const auto second = readRestartPage(descriptor, offset + *place + pageBytes);
    const bool isSecondNewer = second && (!first || second->sequence > first->sequence);
    const auto& newer = isSecondNewer ? second : first;
    return newer && newer->isWaiting;
}

}  // namespace pellar
