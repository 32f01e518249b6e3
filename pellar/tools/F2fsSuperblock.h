// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/bytes/Bytes.h"

namespace pellar {

/// What we read ourselves of an f2fs volume (Linux, include/linux/f2fs_fs.h; all fields
/// little-endian).
struct F2fsSuperblock {
    static constexpr std::size_t size = 512;

    std::uint64_t volumeBytes = 0;
    bool isBackup = false;

    friend bool operator==(const F2fsSuperblock&, const F2fsSuperblock&) = default;
};

std::optional<F2fsSuperblock> parseF2fsSuperblock(Bytes bytes);

/// The superblock in the first block of the volume that starts at `offset`, or its copy in the
/// second.
std::optional<F2fsSuperblock> readF2fsSuperblock(int descriptor, std::uint64_t offset,
                                                 std::uint64_t availableBytes);

}  // namespace pellar
