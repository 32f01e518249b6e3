// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <filesystem>
#include <optional>
#include <string>

namespace pellar {

/// Where the kernel tells what a disk is used for.
struct SystemPaths {
    std::filesystem::path blockDevices = "/sys/block";
    std::filesystem::path mountInfo = "/proc/self/mountinfo";
};

/// All that a file of /proc or /sys says; none when it cannot be opened or read. A device that goes
/// away takes its files with it, also while they are being read (ENODEV).
std::optional<std::string> readKernelFile(const std::filesystem::path& path);

}  // namespace pellar
