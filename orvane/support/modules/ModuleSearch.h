// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/Failure.h"
#include "orvane/support/settings/XDGPaths.h"

#include <filesystem>
#include <string>
#include <vector>

namespace orvane {

/// Where modules are looked for, the first place first: the directories of ORVANE_MODULE_PATH
/// (separated by colons, absolute ones only), beside the program, and the system's.
[[nodiscard]] std::vector<std::filesystem::path> moduleDirectories(
    const EnvironmentLookup& environment, const std::filesystem::path& executable);

/// The host's own bundle, beside the program: the directory with its `locale`.
[[nodiscard]] std::filesystem::path hostBundleDirectory(const std::filesystem::path& executable);

/// The program that is running; empty when /proc is not there.
[[nodiscard]] std::filesystem::path runningExecutable();

/// The module bundles (`NAME.ovmodule`) in the directories, by name within each. One that comes
/// first hides others of its name.
[[nodiscard]] std::vector<std::filesystem::path> findModuleBundles(
    const std::vector<std::filesystem::path>& directories);

/// What a bundle's `module.json` says: {"name": "Fixwell", "library": "fixwell.so"}, and "table",
/// the default string table, where it is another one than "FXW".
struct ModuleDescription {
    std::string name;
    std::filesystem::path library;  ///< with the bundle's path
    std::string defaultTable;
};

[[nodiscard]] Outcome<ModuleDescription> readModuleDescription(const std::filesystem::path& bundle);

/// Done when nobody but root and the user can change the file or directory; code from anywhere
/// else would run with the user's rights, often with root's.
[[nodiscard]] Outcome<> checkIsTrustworthy(const std::filesystem::path& path);

}  // namespace orvane
