// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/mounts/MountTable.h"
#include "pellar/outcome/Result.h"
#include "pellar/process/FileDescriptor.h"

#include <cstdint>
#include <limits>
#include <span>
#include <string>
#include <vector>

namespace pellar {

/// Where something is mounted, kept hold of: others may move the directories on the way there, or
/// put links in their place, while nothing is mounted. What it takes to find the same directory
/// again is found out while something is; nothing of the disk itself stays open.
struct MountPoint {
    static constexpr std::size_t none = std::numeric_limits<std::size_t>::max();

    /// What is known of the directory itself; `inode` is 0 where that is the root of another mount.
    struct Directory {
        std::uint64_t device = 0;
        std::uint64_t inode = 0;
        std::int64_t born = 0;  ///< nanoseconds; 0 where the file system does not say
        std::uint32_t mode = 0;
    };

    FileDescriptor holder;  ///< the directory that it is in; none where the disk itself has that
    std::size_t outer =
        none;         ///< in that case: the point at which that part of the disk is mounted
    std::string way;  ///< and the way there to the directory that it is in
    std::string name;
    Directory below;
    std::uint64_t belowMount =
        0;                    ///< the number of the mount below; 0 where that is the disk's own
    std::uint64_t mount = 0;  ///< the number of the one that was there when this was made
};

/// Why a place cannot be kept hold of.
struct NotHeld {
    std::size_t place;
    int error;  ///< errno value; EBUSY where something else is mounted over it
};

/// Of each place of one disk, in the order in which they were mounted. Needs the right to mount.
[[nodiscard]] Result<std::vector<MountPoint>, NotHeld> holdMountPoints(
    const std::vector<Mount>& places);

// What follows allocates nothing and may run in a forked child (signal-safety(7)). `points` are all
// those of a disk, and `index` says which is meant.

/// Unmounts what was there when it was held; 0, or an errno value: ESTALE when that has gone.
[[nodiscard]] int unmount(std::span<const MountPoint> points, std::size_t index) noexcept;

/// Whether it is mounted (still, or again): something is, and it is not what lay below.
[[nodiscard]] bool isMounted(std::span<const MountPoint> points, std::size_t index) noexcept;

/// What shows there (O_PATH), whatever it is.
[[nodiscard]] FileDescriptor openShown(std::span<const MountPoint> points,
                                       std::size_t index) noexcept;

/// The directory, to be mounted on (O_PATH). Where it has gone from a directory that only root may
/// change, it is made again: the program that made it takes it away with the mount. None, with
/// errno: ESTALE when something else is in its place.
[[nodiscard]] FileDescriptor openToMountOn(std::span<const MountPoint> points,
                                           std::size_t index) noexcept;

/// Opens (O_PATH) what lies below a directory, through no link and not out of it.
[[nodiscard]] FileDescriptor openBelow(int directory, const char* way) noexcept;

/// The name by which a call that takes a path reaches a descriptor, or what lies in it (proc(5)).
class DescriptorPath {
public:
    explicit DescriptorPath(int descriptor, const char* name = nullptr) noexcept;
    const char* get() const noexcept { return text_; }

private:
    char text_[sizeof "/proc/self/fd/-2147483648/" + 255];
};

/// All that it takes to mount a place again as it was, but where that is. Made ready beforehand,
/// because `perform` may have to run where nothing else can.
struct MountCall {
    std::string source;  ///< the device; of a bind mount the way from the root of the file system
    std::string target;  ///< as the user knows it
    std::string filesystem;
    std::string data;         ///< the file system's own options
    unsigned long flags = 0;  ///< of mount(2)
    bool isBind = false;
};

/// The places of one disk, in the order in which they were mounted.
struct MountCalls {
    std::vector<MountCall> calls;
    std::vector<MountPoint> points;
    std::size_t whole = MountPoint::none;  ///< which shows all of the file system, for bind mounts
};

/// Keeps hold of where the places are. Needs the right to mount.
[[nodiscard]] Result<MountCalls, NotHeld> mountCallsFor(const std::vector<Mount>& places);

/// Mounts one of them; 0, or an errno value: ESTALE when its place is another now. Allocates
/// nothing and may run in a forked child (signal-safety(7)).
[[nodiscard]] int perform(const MountCalls& calls, std::size_t index) noexcept;

/// Whether what shows at the place is none of these, the places of one disk: who unmounts it by its
/// path unmounts another. NO when it is not known.
[[nodiscard]] bool isCovered(const Mount& place, const std::vector<Mount>& places);

}  // namespace pellar
