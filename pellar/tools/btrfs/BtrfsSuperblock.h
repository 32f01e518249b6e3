// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/bytes/Bytes.h"

#include <array>

namespace pellar {

/// By which a btrfs file system is known: in its superblock, and to the kernel.
using BtrfsId = std::array<std::uint8_t, 16>;

/// What we read ourselves of a btrfs volume (btrfs-progs, Documentation/dev/On-disk-format.rst,
/// "Superblock"; all fields little-endian).
struct BtrfsSuperblock {
    static constexpr std::size_t size = 4096;

    BtrfsId id{};
    std::uint64_t diskBytes = 0;  ///< of this one disk
    std::uint64_t disks = 0;      ///< that the volume is made of
    std::uint64_t log = 0;        ///< where changes are that only a mount brings to their place
    bool isBackup = false;
};

/// The superblock at 64 KiB, or a copy of it at 64 MiB or 256 GiB.
std::optional<BtrfsSuperblock> readBtrfsSuperblock(int descriptor, std::uint64_t offset,
                                                   std::uint64_t availableBytes);

}  // namespace pellar
