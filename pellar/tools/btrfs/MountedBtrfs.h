// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Result.h"
#include "pellar/process/FileDescriptor.h"
#include "pellar/tools/btrfs/BtrfsSuperblock.h"

#include <cstdint>
#include <filesystem>
#include <optional>
#include <vector>

namespace pellar {

/// A mounted btrfs file system, held by a directory of it, and what the kernel knows of it
/// (linux/btrfs.h). While it is held it cannot be unmounted, and it is the same one to the end
/// whatever is mounted over the directory. Any thread.
class MountedBtrfs {
public:
    /// An errno; ENOTTY when the directory belongs to another file system.
    [[nodiscard]] static Result<MountedBtrfs, int> open(const std::filesystem::path& directory);

    int descriptor() const { return directory_.get(); }
    const BtrfsId& id() const { return id_; }
    /// How many it is made of, with those that are missing.
    std::size_t disks() const { return disks_.size(); }

    /// What is stored, in all of its copies; 0 when it is not known.
    std::uint64_t storedBytes() const;
    /// How much of it the scrub that is running has read; none when none runs, or when this user
    /// may not know.
    std::optional<std::uint64_t> scrubbedBytes() const;
    /// Ends the scrub that is running, whoever has begun it, and waits until it has ended.
    void cancelScrub() const;

private:
    MountedBtrfs(FileDescriptor directory, const BtrfsId& id, std::vector<std::uint64_t> disks)
        : directory_(std::move(directory)), id_(id), disks_(std::move(disks))
    {
    }

    FileDescriptor directory_;
    BtrfsId id_;
    std::vector<std::uint64_t> disks_;  ///< their numbers
};

}  // namespace pellar
