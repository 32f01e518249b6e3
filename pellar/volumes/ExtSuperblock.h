// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>

namespace pellar {

/// What we read ourselves of an ext2, ext3 or ext4 superblock before a tool may touch the volume
/// (Linux, Documentation/filesystems/ext4/super.rst; all fields little-endian).
struct ExtSuperblock {
    static constexpr std::size_t size = 1024;

    std::uint64_t blockCount = 0;
    std::uint32_t blockBytes = 0;
    bool hasJournal = false;
    bool hasExternalJournal = false;
    /// The volume is itself the journal of another one.
    bool isJournalDevice = false;
    /// The journal holds changes that are not yet in their place.
    bool needsRecovery = false;
    bool isBackup = false;

    /// Bytes; the greatest number when the product does not fit.
    std::uint64_t volumeBytes() const;

    friend bool operator==(const ExtSuperblock&, const ExtSuperblock&) = default;
};

/// None when the bytes are no superblock: no magic number, impossible geometry, or a checksum
/// that does not fit.
std::optional<ExtSuperblock> parseExtSuperblock(std::span<const std::uint8_t> bytes);

/// The primary superblock of the volume that starts at `offset`, or, where there is none, the first
/// backup at the places where mke2fs(8) puts it for the block sizes 1, 2 and 4 KiB. None when
/// there is neither. Reads a few KiB.
std::optional<ExtSuperblock> readExtSuperblock(int descriptor, std::uint64_t offset,
                                               std::uint64_t availableBytes);

}  // namespace pellar
