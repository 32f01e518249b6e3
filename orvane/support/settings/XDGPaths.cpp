// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/settings/XDGPaths.h"

#include <pwd.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <cstdlib>

namespace orvane {
namespace {

std::filesystem::path absolutePathIn(const EnvironmentLookup& environment, const char* name)
{
    const std::filesystem::path path = environment(name).value_or("");
    return path.is_absolute() ? path : std::filesystem::path();
}

std::filesystem::path accountHomeDirectory()
{
    std::array<char, 4096> room;
    passwd entry = {};
    passwd* found = nullptr;
    if (::getpwuid_r(::getuid(), &entry, room.data(), room.size(), &found) != 0 ||
        found == nullptr || found->pw_dir == nullptr)
        return {};
    return found->pw_dir;
}

/// Or would, once it is made: then the directory above counts.
bool belongsToRoot(std::filesystem::path directory)
{
    struct stat status = {};
    while (::stat(directory.c_str(), &status) != 0 && directory.has_relative_path())
        directory = directory.parent_path();
    return status.st_uid == 0;
}

}  // namespace

std::optional<std::string> environmentValue(const char* name)
{
    const char* const value = std::getenv(name);
    return value != nullptr ? std::optional<std::string>(value) : std::nullopt;
}

XDGPaths xdgPathsFrom(const EnvironmentLookup& environment,
                      const std::filesystem::path& accountHome, const IsForeign& isForeign)
{
    const std::filesystem::path wanted = absolutePathIn(environment, "HOME");
    const std::filesystem::path home = wanted.empty() ? accountHome : wanted;
    const auto below = [&](const char* variable, const char* inHome) -> std::filesystem::path {
        const std::filesystem::path base = absolutePathIn(environment, variable);
        for (const auto& directory : {base, home.empty() ? home : home / inHome})
            if (directory.is_absolute() && !isForeign(directory))
                return directory / "orvane";
        return accountHome.is_absolute() ? accountHome / inHome / "orvane"
                                         : std::filesystem::path();
    };
    return {below("XDG_CONFIG_HOME", ".config"), below("XDG_STATE_HOME", ".local/state"),
            below("XDG_CACHE_HOME", ".cache"), below("XDG_DATA_HOME", ".local/share")};
}

XDGPaths userXDGPaths()
{
    const auto isForeign = [](const std::filesystem::path& directory) {
        return ::geteuid() == 0 && !belongsToRoot(directory);
    };
    return xdgPathsFrom(environmentValue, accountHomeDirectory(), isForeign);
}

}  // namespace orvane
