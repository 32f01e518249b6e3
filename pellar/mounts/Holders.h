// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <filesystem>
#include <string>
#include <string_view>
#include <vector>

namespace pellar {

/// Who keeps a mounted file system busy, each as "name (number)": processes that have a file of it
/// open or mapped, work in it or were started from it, and loop devices on its files. Only what
/// this user may see (proc(5)). Looks at names alone and touches no file system, so it cannot hang
/// on a dead one.
[[nodiscard]] std::vector<std::string> holdersOf(
    std::string_view mountPoint, const std::filesystem::path& processes = "/proc",
    const std::filesystem::path& blockDevices = "/sys/block");

/// The first few of the names in one line, fit to be shown.
[[nodiscard]] std::string shownNames(const std::vector<std::string>& names);

}  // namespace pellar
