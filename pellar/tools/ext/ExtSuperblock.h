// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/bytes/Bytes.h"
#include "pellar/disks/Readability.h"
#include "pellar/probe/DiskProbe.h"

#include <cstddef>
#include <cstdint>
#include <optional>
#include <vector>

namespace pellar {

/// What we read ourselves of an ext2, ext3 or ext4 superblock before a tool may touch the volume
/// (Linux, Documentation/filesystems/ext4/super.rst; all fields little-endian).
struct ExtSuperblock {
    static constexpr std::size_t size = 1024;
    static constexpr std::uint32_t smallestInode = 128;

    std::uint64_t blockCount = 0;
    std::uint32_t blockBytes = 0;
    /// The volume is itself the journal of another one.
    bool isJournalDevice = false;
    /// The journal holds changes that are not yet in their place.
    bool needsRecovery = false;
    bool isBackup = false;

    std::uint64_t inodeCount = 0;
    std::uint64_t freeInodes = 0;
    std::uint32_t firstDataBlock = 0;
    std::uint32_t groupBlocks = 0;  ///< of a block group
    std::uint32_t groupInodes = 0;
    std::uint32_t inodeBytes = smallestInode;
    std::uint32_t descriptorBytes = 0;
    bool hasMetaGroups = false;  ///< descriptors stand in several places
    bool hasFewBackups = false;  ///< two at most, wherever they are
    bool hasSparseBackups = false;

    std::uint64_t groups() const;
    /// What the descriptors of all groups take, whole blocks; 0 when that makes no sense.
    std::uint64_t descriptorTableBytes() const;
    /// Where its copies are, each with the descriptors behind it, as far as they are on the disk;
    /// none where these stand elsewhere than by default.
    std::vector<ByteRange> backups(std::uint64_t availableBytes) const;

    /// Bytes; the greatest number when the product does not fit.
    std::uint64_t volumeBytes() const;
};

/// The primary superblock of the volume that starts at `offset`, or, where there is none, the first
/// backup at the places where mke2fs(8) puts it for the block sizes 1, 2 and 4 KiB. None when
/// there is neither. Reads a few KiB.
std::optional<ExtSuperblock> readExtSuperblock(int descriptor, std::uint64_t offset,
                                               std::uint64_t availableBytes);

/// How many files there are by the volume's own books, directories and those that it keeps for
/// itself among them. None where the books do not agree with each other, or cannot be read.
std::optional<std::uint64_t> countExtFiles(int descriptor, std::uint64_t offset,
                                           const ExtSuperblock& superblock);

/// A backup superblock of ext2, ext3 or ext4 stands where mke2fs puts the first one: the volume
/// was made by it even though its own superblock is gone.
[[nodiscard]] bool hasExtBackupSuperblock(int descriptor, ByteRange range);

}  // namespace pellar
