// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/tools/Tool.h"

#include <string_view>
#include <vector>

namespace pellar {

/// The tool for a file system by libblkid's name of it; null when there is none.
const Tool* toolFor(std::string_view filesystemType);

/// Every tool.
const std::vector<const Tool*>& allTools();

/// The tool for a volume whose kind is to be found out: the first that takes it for its own; null
/// when none does. `disk` is an open descriptor, `offset` where in it the volume begins.
const Tool* toolRecognizing(int disk, std::uint64_t offset, std::uint64_t availableBytes);

// Every tool, each in a file or folder of its file system.

/// Checks ext2, ext3 and ext4 (e2fsck(8), e2fsprogs 1.47).
const Tool& e2fsck();

/// Checks FAT12, FAT16 and FAT32 (fsck.fat(8), dosfstools 4.2). A repair gathers its changes and
/// writes them at its end.
const Tool& fsckFat();

/// Checks exFAT (fsck.exfat(8), exfatprogs 1.2.0).
const Tool& fsckExfat();

/// Checks NTFS (ntfsresize(8) and ntfsfix(8), ntfs-3g 2022.10.3). ntfsresize compares the records
/// of all files with the map of what is in use, and so finds out; ntfsfix mends the boot sector and
/// the copy of the first records, throws the journal away, and marks the volume to be checked by
/// its own system. Nothing here repairs more, so a repair never ends with "repaired".
const Tool& ntfs();

/// Checks XFS (xfs_repair(8), xfsprogs 6.1).
const Tool& xfsRepair();

/// Checks btrfs (btrfs-check(8), btrfs-progs 6.2). It never repairs: by its own manual that is
/// dangerous, and not to be done without a developer's advice.
const Tool& btrfsCheck();

/// Checks f2fs (fsck.f2fs(8), f2fs-tools 1.15).
const Tool& fsckF2fs();

}  // namespace pellar
