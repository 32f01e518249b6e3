// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/btrfs/MountedBtrfs.h"

#include <fcntl.h>
#include <linux/btrfs.h>
#include <linux/btrfs_tree.h>
#include <sys/ioctl.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

namespace pellar {
namespace {

/// In how many places each byte of a group of blocks stands.
std::uint64_t copiesIn(std::uint64_t profile)
{
    if ((profile & BTRFS_BLOCK_GROUP_RAID1C4) != 0)
        return 4;
    if ((profile & BTRFS_BLOCK_GROUP_RAID1C3) != 0)
        return 3;
    constexpr std::uint64_t twice =
        BTRFS_BLOCK_GROUP_DUP | BTRFS_BLOCK_GROUP_RAID1 | BTRFS_BLOCK_GROUP_RAID10;
    return (profile & twice) != 0 ? 2 : 1;
}

// Numbers are given to disks in order and never again, so there may be gaps between them.
std::vector<std::uint64_t> disksOf(int directory, const btrfs_ioctl_fs_info_args& volume)
{
    constexpr std::uint64_t mostNumbers = 65536;
    std::vector<std::uint64_t> disks;
    for (std::uint64_t number = 1; number <= std::min<std::uint64_t>(volume.max_id, mostNumbers) &&
                                   disks.size() < volume.num_devices;
         ++number) {
        btrfs_ioctl_dev_info_args disk = {};
        disk.devid = number;
        if (::ioctl(directory, BTRFS_IOC_DEV_INFO, &disk) == 0)
            disks.push_back(number);
    }
    return disks;
}

}  // namespace

Result<MountedBtrfs, int> MountedBtrfs::open(const std::filesystem::path& directory)
{
    FileDescriptor opened(::open(directory.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    btrfs_ioctl_fs_info_args volume = {};
    if (!opened || ::ioctl(opened.get(), BTRFS_IOC_FS_INFO, &volume) != 0)
        return errno;
    BtrfsId id;
    std::memcpy(id.data(), volume.fsid, id.size());
    auto disks = disksOf(opened.get(), volume);
    return MountedBtrfs(std::move(opened), id, std::move(disks));
}

std::uint64_t MountedBtrfs::storedBytes() const
{
    constexpr std::uint64_t slots = 64;  // there is one for each kind and profile
    std::vector<std::uint64_t> buffer(
        (sizeof(btrfs_ioctl_space_args) + slots * sizeof(btrfs_ioctl_space_info)) / 8);
    auto* const spaces = reinterpret_cast<btrfs_ioctl_space_args*>(buffer.data());
    spaces->space_slots = slots;
    if (::ioctl(directory_.get(), BTRFS_IOC_SPACE_INFO, spaces) != 0)
        return 0;
    std::uint64_t bytes = 0;
    for (std::uint64_t i = 0; i < std::min<std::uint64_t>(spaces->total_spaces, slots); ++i)
        if ((spaces->spaces[i].flags & BTRFS_SPACE_INFO_GLOBAL_RSV) == 0)
            bytes += spaces->spaces[i].used_bytes * copiesIn(spaces->spaces[i].flags);
    return bytes;
}

// A disk that has been scrubbed to its end is "not connected" again, so that a scrub of several
// disks is known by any of them.
std::optional<std::uint64_t> MountedBtrfs::scrubbedBytes() const
{
    std::optional<std::uint64_t> bytes;
    for (const std::uint64_t disk : disks_) {
        btrfs_ioctl_scrub_args scrub = {};
        scrub.devid = disk;
        if (::ioctl(directory_.get(), BTRFS_IOC_SCRUB_PROGRESS, &scrub) == 0)
            bytes = bytes.value_or(0) + scrub.progress.data_bytes_scrubbed +
                    scrub.progress.tree_bytes_scrubbed;
    }
    return bytes;
}

void MountedBtrfs::cancelScrub() const
{
    ::ioctl(directory_.get(), BTRFS_IOC_SCRUB_CANCEL, nullptr);
}

}  // namespace pellar
