// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/ntfs/NtfsState.h"

#include "pellar/tools/ntfs/NtfsRecord.h"

namespace pellar {
namespace {

constexpr std::uint64_t journalRecord = 2;
constexpr std::uint64_t volumeRecord = 3;
constexpr std::uint32_t volumeInformation = 0x70;
constexpr std::uint32_t data = 0x80;
constexpr std::size_t pageBytes = 4096;

/// Where the first piece of a file lies, bytes from the start of the volume. The pieces follow each
/// other as pairs of numbers, whose widths stand in a byte before them.
std::optional<std::uint64_t> placeOfFirstPiece(Bytes attribute, std::uint64_t clusterBytes)
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
