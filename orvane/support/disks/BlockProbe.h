// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace orvane {

/// A stretch of an open file or device, in bytes.
struct ByteRange {
    std::uint64_t offset = 0;
    std::uint64_t length = 0;
};

/// What a superblock says of itself, in the words of libblkid; empty where it says nothing.
struct Superblock {
    std::string usage;  ///< "filesystem", "raid", "crypto", "other"
    std::string type;   ///< "ext4", "vfat", "swap", ...
    std::string label;  ///< any bytes
    std::string uuid;

    /// Something that people keep files in.
    bool isFilesystem() const { return usage == "filesystem"; }
};

struct Partition {
    int number = 0;  ///< from 1; logical ones of an MBR from 5
    ByteRange range;
    bool isContainer = false;  ///< holds other partitions, not data
    std::string type;          ///< "0x83", or the GUID in small letters
    std::string name;          ///< of GPT; any bytes
};

struct PartitionTable {
    std::string type;  ///< "gpt", "dos", ...
    std::vector<Partition> partitions;
};

// All of these only read, from any thread, and leave the descriptor open. Contents that make no
// sense count as none.

/// Ambiguous contents (signatures of two file systems) are none, too: a guess could be the wrong
/// one, and a tool let loose on it would destroy what is there.
[[nodiscard]] Superblock readSuperblock(int descriptor, ByteRange range);
[[nodiscard]] std::optional<PartitionTable> readPartitionTable(int descriptor);

/// What looks like an MBR without partitions is the boot sector of a file system: both end in the
/// same two bytes, and libblkid knows them apart for sound FAT and NTFS volumes alone.
[[nodiscard]] bool isBootSector(int descriptor, const PartitionTable& table,
                                const Superblock& superblock);

/// A backup superblock of ext2, ext3 or ext4 stands where mke2fs puts the first one: the volume
/// was made by it even though its own superblock is gone.
[[nodiscard]] bool hasExtBackupSuperblock(int descriptor, ByteRange range);
/// A GPT header stands at the start or the end, or an MBR with entries, whether or not it makes
/// sense. A FAT volume can look like that too: to be asked where no file system was found.
[[nodiscard]] bool hasPartitionTableTraces(int descriptor);

/// The partition's type announces a file system of a kind that can be checked.
[[nodiscard]] bool announcesFilesystem(const Partition& partition);

}  // namespace orvane
