// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/KernelFiles.h"

#include <sys/types.h>

#include <cstdint>
#include <filesystem>
#include <optional>
#include <string>
#include <string_view>
#include <tuple>
#include <vector>

namespace pellar {

/// One mount of this process's mount namespace: all that is needed to mount it so again.
struct Mount {
    dev_t device = 0;  ///< a file system on several devices (btrfs) has a number of its own
    std::string source;
    std::string target;
    std::string root;  ///< what of the file system is mounted; "/" unless it is a bind mount
    std::string filesystem;
    std::string options;  ///< as mount(8) takes them
    /// It was asked for. A file system that the kernel no longer writes since it met an error is
    /// not: that one is still to be repaired.
    bool isReadOnly = false;
    std::uint64_t id = 0;      ///< the kernel's number of this mount; 0 when it is not known
    std::uint64_t parent = 0;  ///< of the one that it lies on

    bool isBind() const { return root != "/" && filesystem != "btrfs"; }

    /// Mounted in the same way; the numbers are new each time.
    friend bool operator==(const Mount& left, const Mount& right)
    {
        return std::tie(left.source, left.target, left.root, left.filesystem, left.options) ==
               std::tie(right.source, right.target, right.root, right.filesystem, right.options);
    }
};

/// The mounts that a list in the format of /proc/self/mountinfo (proc(5)) names, in its order.
/// Lines that are no mounts are left out.
[[nodiscard]] std::vector<Mount> parseMounts(std::string_view mountInfo);

/// All mounts; none as well when the list cannot be read.
[[nodiscard]] std::vector<Mount> currentMounts(const SystemPaths& paths = {});

/// Whether a file system on this block device is mounted. YES also when the list cannot be read:
/// what is not known to be free is not touched.
[[nodiscard]] bool isMounted(dev_t device, const SystemPaths& paths);

/// Where a block device's file system is mounted, in the order in which it was. Also of a file
/// system on several devices, which is found by its source. Empty as well when the list cannot be
/// read.
[[nodiscard]] std::vector<Mount> mountsOf(dev_t device, const SystemPaths& paths);

/// The same of the device with this node; empty when it is none.
[[nodiscard]] std::vector<Mount> mountsOf(const std::filesystem::path& node,
                                          const SystemPaths& paths);

/// The mount that a device is known by: "/" when it is mounted there, else its first mount of the
/// whole file system, else its first at all. A file system on several devices is found by the path
/// of its source.
[[nodiscard]] std::optional<Mount> mountOfDevice(const std::vector<Mount>& mounts, dev_t device,
                                                 const std::filesystem::path& node);

/// The mount on which this absolute path lies, its links followed; none when there is no mount at
/// all.
[[nodiscard]] std::optional<Mount> mountHolding(const std::vector<Mount>& mounts,
                                                const std::filesystem::path& path);

}  // namespace pellar
