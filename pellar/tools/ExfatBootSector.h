// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/bytes/Bytes.h"

namespace pellar {

/// What we read ourselves of an exFAT volume (Microsoft, "exFAT file system specification",
/// section 3).
struct ExfatBootSector {
    static constexpr std::size_t size = 512;

    std::uint64_t volumeBytes = 0;
    std::uint32_t sectorBytes = 0;
    bool isMarkedDirty = false;  ///< not properly unmounted
    bool isBackup = false;

    friend bool operator==(const ExfatBootSector&, const ExfatBootSector&) = default;
};

std::optional<ExfatBootSector> parseExfatBootSector(Bytes bytes);

/// The boot sector of the volume that starts at `offset`, or its backup in sector 12, for every
/// size that a sector may have.
std::optional<ExfatBootSector> readExfatBootSector(int descriptor, std::uint64_t offset,
                                                   std::uint64_t availableBytes);

}  // namespace pellar
