// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/files/Failure.h"
#include "orvane/support/settings/XDGPaths.h"

#include <filesystem>
#include <string>
#include <string_view>
#include <vector>

namespace orvane {

/// The directories that a variable names: absolute ones, separated by colons. For root, those that
/// others could change are left out; `refused` (may be empty) is told of each and why.
[[nodiscard]] std::vector<std::filesystem::path> directoriesNamedBy(
    const char* variable, const EnvironmentLookup& environment, const WarningSink& refused);

/// Where modules are looked for, the first place first: the directories of ORVANE_MODULE_PATH,
/// beside the program, and the system's. `refused` as above.
[[nodiscard]] std::vector<std::filesystem::path> moduleDirectories(
    const EnvironmentLookup& environment, const std::filesystem::path& executable,
    const WarningSink& refused = {});

/// The host's own bundle, beside the program: the directory with its `locale`.
[[nodiscard]] std::filesystem::path hostBundleDirectory(const std::filesystem::path& executable);

/// The program that is running; empty when /proc is not there.
[[nodiscard]] std::filesystem::path runningExecutable();

/// The module bundles (`NAME.ovmodule`) in the directories, by name within each. One that comes
/// first hides others of its name.
[[nodiscard]] std::vector<std::filesystem::path> findModuleBundles(
    const std::vector<std::filesystem::path>& directories);

/// The module that checks disks, whatever other modules are installed.
inline constexpr std::string_view checkingModule = "Fixwell";

/// The bundle of the module of that name; empty when it is not there.
[[nodiscard]] std::filesystem::path findModule(
    const std::vector<std::filesystem::path>& directories, std::string_view name);

}  // namespace orvane
