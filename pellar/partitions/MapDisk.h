// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/pellar/DiskReference.h"
#include "pellar/partitions/FileSectors.h"
#include "pellar/partitions/PartitionMap.h"
#include "pellar/process/FileDescriptor.h"

namespace pellar {

/// None when it cannot be opened, or is neither a device nor a file. Does not wait, and does not
/// mind that the disk is in use.
[[nodiscard]] FileDescriptor openDiskForReading(const contract::DiskReference& disk);

/// Bytes of the disk that are really there.
[[nodiscard]] std::uint64_t lengthOfDisk(int descriptor, const contract::DiskReference& disk);

/// A disk in the sectors that its map counts in: those of the device; of an image 512 bytes, or
/// 4096 where only they fit what stands there. The descriptor outlives the answer. `length` bytes
/// from `offset` are the disk.
[[nodiscard]] FileSectors sectorsOf(int descriptor, std::uint64_t offset, std::uint64_t length);

/// The map of an open disk, with what fills the whole of it.
[[nodiscard]] PartitionMap readMapOf(int descriptor, const FileSectors& sectors,
                                     std::uint64_t offset, std::uint64_t length);

/// Opens the disk for a look and reads its map; a map of no kind when it cannot be opened. Reads a
/// few sectors.
[[nodiscard]] PartitionMap glanceAtMap(const contract::DiskReference& disk);

}  // namespace pellar
