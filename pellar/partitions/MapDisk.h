// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/pellar/DiskReference.h"
#include "pellar/disks/DiskClaim.h"
#include "pellar/outcome/Result.h"
#include "pellar/partitions/PartitionMap.h"
#include "pellar/partitions/RepairPlan.h"
#include "pellar/partitions/Sectors.h"
#include "pellar/process/FileDescriptor.h"

#include <optional>

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
[[nodiscard]] PartitionMap readMapOf(int descriptor, const Sectors& sectors, std::uint64_t offset,
                                     std::uint64_t length);

/// Opens the disk for a look and reads its map; a map of no kind when it cannot be opened. Reads a
/// few sectors.
[[nodiscard]] PartitionMap glanceAtMap(const contract::DiskReference& disk);

/// A whole disk that is open for the length of a job on its map. To verify, it may be in use: a map
/// does not change under a mounted volume. To repair, it is claimed, and a device is held so that
/// the kernel lets nobody mount or attach a part of it meanwhile.
class MapClaim {
public:
    /// kPLErrorDiskInUse also when a partition is mounted or in use, kPLErrorReadOnly,
    /// kPLErrorCannotOpen.
    [[nodiscard]] static Result<MapClaim, contract::ErrorCode> take(
        const contract::DiskReference& disk, Access access, const SystemPaths& paths);

    FileSectors sectors() const;
    [[nodiscard]] PartitionMap readMap() const;
    /// As it will be.
    [[nodiscard]] PartitionMap readMap(const RepairPlan& plan) const;
    int descriptor() const { return disk_.get(); }
    std::uint64_t offset() const { return offset_; }
    std::uint64_t length() const { return length_; }
    /// Asks the kernel to read a device's map again; NO when it refuses. Nothing to do for a file.
    [[nodiscard]] bool rereadPartitions() const;

private:
    MapClaim(FileDescriptor disk, std::optional<DiskClaim> claim, std::uint64_t offset,
             std::uint64_t length)
        : claim_(std::move(claim)), disk_(std::move(disk)), offset_(offset), length_(length)
    {
    }

    std::optional<DiskClaim> claim_;
    FileDescriptor disk_;
    std::uint64_t offset_;
    std::uint64_t length_;
};

}  // namespace pellar
