// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/probe/DiskProbe.h"
#include "pellar/tools/ext/ExtSuperblock.h"

namespace orvane {

using pellar::ByteRange;
using pellar::hasExtBackupSuperblock;
using pellar::Partition;
using pellar::PartitionTable;
using pellar::readPartitionTable;
using pellar::readSuperblock;
using pellar::Superblock;

// All of these only read, from any thread, and leave the descriptor open.

/// What looks like an MBR without partitions is the boot sector of a file system: both end in the
/// same two bytes, and libblkid knows them apart for sound FAT and NTFS volumes alone.
[[nodiscard]] bool isBootSector(int descriptor, const PartitionTable& table,
                                const Superblock& superblock);

/// A GPT header stands at the start or the end, or an MBR with entries, whether or not it makes
/// sense. A FAT volume can look like that too: to be asked where no file system was found.
[[nodiscard]] bool hasPartitionTableTraces(int descriptor);

/// The partition's type announces a file system of a kind that can be checked.
[[nodiscard]] bool announcesFilesystem(const Partition& partition);

}  // namespace orvane
