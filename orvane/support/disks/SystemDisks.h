// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/disks/DiskFacts.h"
#include "pellar/mounts/MountTable.h"

#include <filesystem>
#include <optional>
#include <vector>

namespace orvane {

/// Where the facts about the system's disks are read from. Tests give directories of their own.
struct DiskSources {
    std::filesystem::path sysBlock = "/sys/block";
    std::filesystem::path dev = "/dev";
    std::filesystem::path udevData = "/run/udev/data";
    std::vector<pellar::Mount> mounts = pellar::currentMounts();
    std::filesystem::path homeDirectory;  ///< of the user; empty when there is none
    /// NO: only what udev has found out of them is told, and no drive is waited for.
    bool opensDevices = true;
};

/// The block devices of this machine, with their partitions. Needs no privileges, but what may
/// not be read has only what udev knows of it. RAM disks, compressed memory and unused loop
/// devices are left out. Any thread; reading a sleeping drive may take seconds.
[[nodiscard]] std::vector<DiskTree> readSystemDisks(const DiskSources& sources);

/// The facts of one block device by its node, where it is not among the above (a node with a name
/// of its own); none when it is no block device.
[[nodiscard]] std::optional<DiskFacts> readBlockDevice(const std::filesystem::path& node,
                                                       const DiskSources& sources);

}  // namespace orvane
