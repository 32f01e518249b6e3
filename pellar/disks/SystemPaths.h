// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <filesystem>

namespace pellar {

/// Where the kernel tells what a disk is used for.
struct SystemPaths {
    std::filesystem::path blockDevices = "/sys/block";
    std::filesystem::path mountInfo = "/proc/self/mountinfo";
};

}  // namespace pellar
