// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/bytes/Bytes.h"

namespace pellar {

/// What we read ourselves of an XFS volume (xfsprogs' "XFS Algorithms & Data Structures",
/// "Superblocks"; all fields big-endian).
struct XfsSuperblock {
    static constexpr std::size_t size = 512;

    std::uint64_t volumeBytes = 0;
    std::uint64_t groupBytes = 0;  ///< of an allocation group; each begins with a superblock
    bool hasExternalLog = false;
    bool hasRealtimePart = false;  ///< kept on another disk
    bool isBackup = false;

    friend bool operator==(const XfsSuperblock&, const XfsSuperblock&) = default;
};

std::optional<XfsSuperblock> parseXfsSuperblock(Bytes bytes);

/// The superblock of the volume that starts at `offset`, or, where there is none, that of the
/// second allocation group at the places where mkfs.xfs(8) puts it on a single disk.
std::optional<XfsSuperblock> readXfsSuperblock(int descriptor, std::uint64_t offset,
                                               std::uint64_t availableBytes);

}  // namespace pellar
