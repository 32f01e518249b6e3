// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/bytes/Bytes.h"

namespace pellar {

/// What we read ourselves of a FAT volume (ECMA-107 for FAT12 and FAT16, Microsoft's "FAT: General
/// Overview of On-Disk Format" for FAT32).
struct FatBootSector {
    static constexpr std::size_t size = 512;

    int bits = 0;  ///< 12, 16 or 32
    std::uint64_t volumeBytes = 0;
    bool isMarkedDirty = false;  ///< not properly unmounted
    bool isBackup = false;

    friend bool operator==(const FatBootSector&, const FatBootSector&) = default;
};

/// None when the bytes are no boot sector of a FAT volume. It has no magic number of its own, so
/// every field that a volume cannot do without has to make sense.
std::optional<FatBootSector> parseFatBootSector(Bytes bytes);

/// The boot sector of the volume that starts at `offset`, or the backup that a FAT32 volume keeps
/// in its sector 6.
std::optional<FatBootSector> readFatBootSector(int descriptor, std::uint64_t offset,
                                               std::uint64_t availableBytes);

}  // namespace pellar
