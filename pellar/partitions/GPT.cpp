// SPDX-License-Identifier: Apache-2.0
#include "pellar/partitions/GPT.h"

#include "contract/foundation/UTF8.h"
#include "pellar/bytes/Checksums.h"

#include <algorithm>
#include <string_view>

namespace pellar {
namespace {

constexpr std::string_view signature = "EFI PART";
constexpr std::uint64_t revision = 0x00010000;
constexpr std::uint64_t leastHeaderBytes = 92;
constexpr std::uint64_t leastEntryBytes = 128;
constexpr std::uint64_t mostEntryBytes = 4096;

bool hasSignature(const Bytes& sector)
{
    return std::equal(signature.begin(), signature.end(), sector.begin());
}

std::uint32_t checksumOf(const Bytes& sector, std::uint64_t headerBytes)
{
    Bytes header = sector;
    putLittleEndian(header, 16, 4, 0);
    return crc32(ByteView(header).first(headerBytes));
}

bool hasRightChecksum(const Bytes& sector)
{
    const std::uint64_t headerBytes = littleEndian(sector, 12, 4);
    return headerBytes >= leastHeaderBytes && headerBytes <= sector.size() &&
           checksumOf(sector, headerBytes) == littleEndian(sector, 16, 4);
}

GPTHeader parse(const Bytes& sector)
{
    GPTHeader header;
    header.place = littleEndian(sector, 24, 8);
    header.otherPlace = littleEndian(sector, 32, 8);
    header.firstUsable = littleEndian(sector, 40, 8);
    header.lastUsable = littleEndian(sector, 48, 8);
    std::copy_n(sector.begin() + 56, header.disk.size(), header.disk.begin());
    header.entriesPlace = littleEndian(sector, 72, 8);
    header.entryCount = static_cast<std::uint32_t>(littleEndian(sector, 80, 4));
    header.entryBytes = static_cast<std::uint32_t>(littleEndian(sector, 84, 4));
    header.entriesChecksum = static_cast<std::uint32_t>(littleEndian(sector, 88, 4));
    return header;
}

bool hasSensibleEntries(const GPTHeader& header)
{
    return header.entryBytes >= leastEntryBytes && header.entryBytes <= mostEntryBytes &&
           header.entryBytes % 8 == 0 && header.entryCount > 0 &&
           header.entriesLength() <= mostEntriesBytes;
}

/// The list of partitions lies between its header and the usable sectors, on either side.
bool hasSensibleOrder(const GPTHeader& header, std::uint32_t sectorBytes)
{
    const std::uint64_t length = header.entriesSectors(sectorBytes);
    if (header.firstUsable > header.lastUsable)
        return false;
    if (header.place == primaryHeaderPlace)
        return header.otherPlace > header.lastUsable && header.entriesPlace > header.place &&
               header.entriesPlace < header.firstUsable &&
               length <= header.firstUsable - header.entriesPlace;
    return header.place > header.lastUsable && header.otherPlace == 1 && header.firstUsable > 1 &&
           header.entriesPlace > header.lastUsable && header.entriesPlace < header.place &&
           length <= header.place - header.entriesPlace;
}

bool isSensible(const Bytes& sector, const GPTHeader& header)
{
    const auto sectorBytes = static_cast<std::uint32_t>(sector.size());
    return littleEndian(sector, 8, 4) == revision && hasSensibleEntries(header) &&
           hasSensibleOrder(header, sectorBytes);
}

constexpr std::size_t nameOffset = 56;
constexpr std::size_t nameUnits = 36;

constexpr bool isHighSurrogate(std::uint64_t unit)
{
    return unit >= 0xD800 && unit < 0xDC00;
}

constexpr bool isLowSurrogate(std::uint64_t unit)
{
    return unit >= 0xDC00 && unit < 0xE000;
}

/// UTF-16LE up to the first zero; half a surrogate pair is U+FFFD.
std::string nameIn(ByteView entry)
{
    std::string name;
    for (std::size_t i = 0; i < nameUnits; ++i) {
        const std::uint64_t unit = littleEndian(entry, nameOffset + 2 * i, 2);
        if (unit == 0)
            break;
        const std::uint64_t next =
            i + 1 < nameUnits ? littleEndian(entry, nameOffset + 2 * (i + 1), 2) : 0;
        if (isHighSurrogate(unit) && isLowSurrogate(next)) {
            contract::appendUTF8(
                name, static_cast<char32_t>(0x10000 + ((unit - 0xD800) << 10U) + (next - 0xDC00)));
            ++i;
        } else {
            const bool isHalf = isHighSurrogate(unit) || isLowSurrogate(unit);
            contract::appendUTF8(name, isHalf ? U'\uFFFD' : static_cast<char32_t>(unit));
        }
    }
    return name;
}

GUID guidAt(ByteView entry, std::size_t offset)
{
    GUID guid;
    std::copy_n(entry.begin() + static_cast<std::ptrdiff_t>(offset), guid.size(), guid.begin());
    return guid;
}

}  // namespace

HeaderReading readHeader(const Sectors& sectors, std::uint64_t place)
{
    HeaderReading reading;
    auto sector = sectors.read(place, 1);
    if (!sector)
        return reading;
    reading.sector = *std::move(sector);
    if (!hasSignature(reading.sector)) {
        reading.fault = HeaderFault::Missing;
    } else if (!hasRightChecksum(reading.sector)) {
        reading.fault = HeaderFault::WrongChecksum;
    } else {
        reading.header = parse(reading.sector);
        if (reading.header.place != place)
            reading.fault = HeaderFault::WrongPlace;
        else
            reading.fault = isSensible(reading.sector, reading.header) ? HeaderFault::None
                                                                       : HeaderFault::Nonsense;
    }
    return reading;
}

Bytes headerSector(const Bytes& original, const GPTHeader& header)
{
    Bytes sector = original;
    putLittleEndian(sector, 24, 8, header.place);
    putLittleEndian(sector, 32, 8, header.otherPlace);
    putLittleEndian(sector, 40, 8, header.firstUsable);
    putLittleEndian(sector, 48, 8, header.lastUsable);
    std::copy(header.disk.begin(), header.disk.end(), sector.begin() + 56);
    putLittleEndian(sector, 72, 8, header.entriesPlace);
    putLittleEndian(sector, 80, 4, header.entryCount);
    putLittleEndian(sector, 84, 4, header.entryBytes);
    putLittleEndian(sector, 88, 4, header.entriesChecksum);
    putLittleEndian(sector, 16, 4, checksumOf(sector, littleEndian(sector, 12, 4)));
    return sector;
}

std::vector<GPTEntry> usedEntries(const Bytes& bytes, const GPTHeader& header)
{
    std::vector<GPTEntry> entries;
    for (std::uint32_t i = 0; i < header.entryCount; ++i) {
        const ByteView entry =
            ByteView(bytes).subspan(std::size_t{i} * header.entryBytes, header.entryBytes);
        if (isZero(guidAt(entry, 0)))  // the type of an entry that is not in use
            continue;
        entries.push_back({i + 1, guidAt(entry, 16), littleEndian(entry, 32, 8),
                           littleEndian(entry, 40, 8), nameIn(entry)});
    }
    return entries;
}

}  // namespace pellar
