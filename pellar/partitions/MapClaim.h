// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/disks/DiskClaim.h"
#include "pellar/partitions/FileSectors.h"
#include "pellar/partitions/PartitionMap.h"

#include <optional>
#include <variant>

namespace pellar {

/// A whole disk that is open for the length of a job on its map. To verify, it may be in use: a map
/// does not change under a mounted volume. To repair, it is claimed, and a device is held so that
/// the kernel lets nobody mount or attach a part of it meanwhile.
class MapClaim {
public:
    /// kPLErrorDiskInUse also when a partition is mounted or in use, kPLErrorReadOnly,
    /// kPLErrorCannotOpen.
    [[nodiscard]] static std::variant<MapClaim, contract::ErrorCode> take(
        const contract::DiskReference& disk, Access access, const SystemPaths& paths);

    FileSectors sectors() const;
    [[nodiscard]] PartitionMap readMap() const;
    std::uint64_t offset() const { return offset_; }
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
