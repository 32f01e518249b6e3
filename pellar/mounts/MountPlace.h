// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/KernelFiles.h"

#include <sys/types.h>

#include <cstdint>
#include <filesystem>
#include <string>
#include <string_view>
#include <tuple>
#include <vector>

namespace pellar {

/// Where and how a file system is mounted: all that is needed to mount it so again.
struct MountPlace {
    std::string source;
    std::string target;
    std::string root;  ///< what of the file system is mounted; "/" unless it is a bind mount
    std::string filesystem;
    std::string options;       ///< as mount(8) takes them
    std::uint64_t id = 0;      ///< the kernel's number of this mount; 0 when it is not known
    std::uint64_t parent = 0;  ///< of the one that it lies on

    bool isBind() const { return root != "/" && filesystem != "btrfs"; }

    /// Mounted in the same way; the numbers are new each time.
    friend bool operator==(const MountPlace& left, const MountPlace& right)
    {
        return std::tie(left.source, left.target, left.root, left.filesystem, left.options) ==
               std::tie(right.source, right.target, right.root, right.filesystem, right.options);
    }
};

/// Where a block device's file system is mounted, in the order in which it was. Also of a file
/// system on several devices, which has a device number of its own and is found by its source.
/// Empty as well when the table cannot be read.
[[nodiscard]] std::vector<MountPlace> mountPlacesOf(dev_t device, const SystemPaths& paths);

/// The same of the device with this node; empty when it is none.
[[nodiscard]] std::vector<MountPlace> mountPlacesOf(const std::filesystem::path& node,
                                                    const SystemPaths& paths);

/// Whether the directory lies on what is mounted at one of the places.
[[nodiscard]] bool holdsDirectory(const std::vector<MountPlace>& places,
                                  const std::filesystem::path& directory, const SystemPaths& paths);

/// Where something else is mounted below the directory.
[[nodiscard]] std::vector<std::string> mountsBelow(std::string_view directory,
                                                   const SystemPaths& paths);

/// The options without those that the kernel tells but does not take (a security module's own).
[[nodiscard]] std::string mountableOptions(std::string_view options);

}  // namespace pellar
