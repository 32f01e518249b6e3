// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/partitions/Sectors.h"

#include <array>
#include <cstdint>
#include <string>
#include <vector>

namespace pellar {

/// As it stands on the disk; never taken apart here, only compared.
using GUID = std::array<std::uint8_t, 16>;

constexpr bool isZero(const GUID& guid)
{
    return guid == GUID{};
}

/// The header of one copy of a GUID partition table (UEFI Specification 2.10, 5.3.2). Places are
/// sector numbers.
struct GPTHeader {
    std::uint64_t place = 0;
    std::uint64_t otherPlace = 0;  ///< of the other copy's header
    std::uint64_t firstUsable = 0;
    std::uint64_t lastUsable = 0;
    GUID disk{};
    std::uint64_t entriesPlace = 0;
    std::uint32_t entryCount = 0;
    std::uint32_t entryBytes = 0;
    std::uint32_t entriesChecksum = 0;

    /// Bytes; small in a header without fault.
    std::uint64_t entriesLength() const { return std::uint64_t{entryCount} * entryBytes; }
    std::uint64_t entriesSectors(std::uint32_t sectorBytes) const
    {
        return (entriesLength() + sectorBytes - 1) / sectorBytes;
    }

    friend bool operator==(const GPTHeader&, const GPTHeader&) = default;
};

enum class HeaderFault {
    None,
    Unreadable,
    Missing,        ///< there is no signature
    WrongChecksum,  ///< also where the header's size makes no sense
    WrongPlace,     ///< a sound header, but of another sector
    Nonsense,       ///< a right checksum over numbers that cannot be
};

struct HeaderReading {
    HeaderFault fault = HeaderFault::Unreadable;
    GPTHeader header;  ///< meaningful from WrongPlace on
    Bytes sector;      ///< as it stands on the disk; empty when it cannot be read

    bool hasSignature() const
    {
        return fault != HeaderFault::Unreadable && fault != HeaderFault::Missing;
    }
};

/// Where the first copy's header stands, always.
inline constexpr std::uint64_t primaryHeaderPlace = 1;

/// The greatest list of partitions that is read; usual is 16 KiB.
inline constexpr std::uint64_t mostEntriesBytes = 4U << 20U;

/// Reads the header that stands at `place`.
[[nodiscard]] HeaderReading readHeader(const Sectors& sectors, std::uint64_t place);

/// The sector of a header with these numbers; all that `original` says beside them is kept.
[[nodiscard]] Bytes headerSector(const Bytes& original, const GPTHeader& header);

/// One partition of a GUID partition table (UEFI Specification 2.10, 5.3.3).
struct GPTEntry {
    std::uint32_t number = 0;  ///< from 1
    GUID unique{};
    std::uint64_t first = 0;
    std::uint64_t last = 0;
    std::string name;  ///< UTF-8 of what stands there; any characters
};

/// The entries that are in use. `bytes` are all of the list that the header describes.
[[nodiscard]] std::vector<GPTEntry> usedEntries(const Bytes& bytes, const GPTHeader& header);

}  // namespace pellar
