// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <filesystem>
#include <functional>
#include <optional>
#include <string>

namespace orvane {

/// What a variable of the environment says; none when it is not set.
using EnvironmentLookup = std::function<std::optional<std::string>(const char* name)>;

/// The process's own environment.
[[nodiscard]] std::optional<std::string> environmentValue(const char* name);

/// The host's own directories, each "orvane" below a base directory of the XDG Base Directory
/// Specification 0.8. None of them need exist. All are empty where the user has no home directory
/// at all; services then keep what they have in memory.
struct XDGPaths {
    std::filesystem::path config;
    std::filesystem::path state;
    std::filesystem::path cache;
    std::filesystem::path data;
};

/// Whether a base directory is another user's.
using IsForeign = std::function<bool(const std::filesystem::path& directory)>;

/// `accountHome` stands in when HOME is not set or foreign; a variable that is no absolute path is
/// ignored, as that standard asks, and so is one that names a foreign directory.
[[nodiscard]] XDGPaths xdgPathsFrom(
    const EnvironmentLookup& environment, const std::filesystem::path& accountHome,
    const IsForeign& isForeign = [](const std::filesystem::path&) { return false; });

/// For this process: its environment, and the home directory of its account (passwd(5)). For root,
/// to whom an environment may have been left by another user (sudo -E), that user's directories are
/// foreign: what root makes in them the user could not use any more, and links in them lead root
/// anywhere.
[[nodiscard]] XDGPaths userXDGPaths();

}  // namespace orvane
