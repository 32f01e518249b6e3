// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/partitions/Sectors.h"

#include <array>
#include <vector>

namespace pellar {

/// One of the four entries of a boot sector or of a link of an extended chain (UEFI Specification
/// 2.10, 5.2.1).
struct MBREntry {
    std::uint8_t flag = 0;
    std::uint8_t type = 0;
    std::uint32_t start = 0;  ///< sectors, from the disk's start or what the link counts from
    std::uint32_t count = 0;

    bool isUsed() const { return type != 0; }
    bool isProtective() const { return type == 0xEE; }
    bool isExtended() const { return type == 0x05 || type == 0x0F || type == 0x85; }
    bool hasKnownFlag() const { return flag == 0 || flag == 0x80; }
};

inline constexpr std::size_t mbrEntriesOffset = 446;
inline constexpr std::size_t mbrEntryBytes = 16;

struct MBRSector {
    bool isReadable = false;
    bool hasSignature = false;  ///< 55 AA
    /// It starts a FAT, exFAT or NTFS volume: what stands in the entries' place is code.
    bool startsVolume = false;
    std::array<MBREntry, 4> entries;

    bool hasProtective() const;
    /// Used entries that are not the protective one.
    std::size_t ordinaryCount() const;
};

[[nodiscard]] MBRSector readMBRSector(const Sectors& sectors, std::uint64_t place);

/// A partition of an MBR, in sectors from the disk's start.
struct MBRPartition {
    int number = 0;  ///< 1 to 4, logical ones from 5
    MBREntry entry;
    std::uint64_t first = 0;

    std::uint64_t count() const { return entry.count; }
    bool isLogical() const { return number > 4; }
};

enum class ChainFault {
    None,
    Broken,   ///< a link is no such thing, or cannot be read
    Outside,  ///< a link lies outside of the extended partition or the disk
    Loop,
    TooLong,
};

struct MBRPartitions {
    std::vector<MBRPartition> partitions;
    ChainFault chain = ChainFault::None;
    int extendedCount = 0;
};

/// The partitions of the boot sector and those of the extended chain behind it, as far as it can
/// be followed.
[[nodiscard]] MBRPartitions readMBRPartitions(const Sectors& sectors, const MBRSector& boot);

}  // namespace pellar
