// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/modules/ModuleSearch.h"

#include "pellar/process/TrustedPath.h"

#include <unistd.h>

#include <fmt/format.h>
#include <algorithm>
#include <sstream>

namespace orvane {

namespace fs = std::filesystem;

std::vector<fs::path> directoriesNamedBy(const char* variable, const EnvironmentLookup& environment,
                                         const WarningSink& refused)
{
    std::vector<fs::path> directories;
    std::istringstream named(environment(variable).value_or(""));
    std::error_code error;
    for (std::string directory; std::getline(named, directory, ':');) {
        if (!fs::path(directory).is_absolute())
            continue;
        const bool isLookedAt = ::geteuid() == 0 && fs::exists(directory, error);
        if (!isLookedAt)
            directories.emplace_back(directory);
        else if (const auto opened = pellar::openTrusted(directory))
            directories.emplace_back(directory);
        else if (refused)
            refused(cannot(fmt::format("use, as root, {}'s", variable), directory, opened.error())
                        .message);
    }
    return directories;
}

std::vector<fs::path> moduleDirectories(const EnvironmentLookup& environment,
                                        const fs::path& executable, const WarningSink& refused)
{
    auto directories = directoriesNamedBy("ORVANE_MODULE_PATH", environment, refused);
    if (!executable.empty()) {
        const fs::path above = executable.parent_path().parent_path();
        directories.push_back(above / "lib/orvane/modules");
        directories.push_back(above / "modules");
    }
    directories.emplace_back("/usr/lib/orvane/modules");
    return directories;
}

fs::path runningExecutable()
{
    std::error_code error;
    fs::path executable = fs::read_symlink("/proc/self/exe", error);
    return error ? fs::path() : executable;
}

std::vector<fs::path> findModuleBundles(const std::vector<fs::path>& directories)
{
    std::vector<fs::path> bundles;
    for (const fs::path& directory : directories) {
        std::vector<fs::path> found;
        std::error_code error;
        for (fs::directory_iterator entry(directory, error), end; !error && entry != end;
             entry.increment(error)) {
            const bool isHidden =
                std::any_of(bundles.begin(), bundles.end(), [&](const fs::path& other) {
                    return other.filename() == entry->path().filename();
                });
            if (entry->path().extension() == ".ovmodule" && !isHidden)
                found.push_back(entry->path());
        }
        std::sort(found.begin(), found.end());
        bundles.insert(bundles.end(), found.begin(), found.end());
    }
    return bundles;
}

fs::path findModule(const std::vector<fs::path>& directories, std::string_view name)
{
    const auto bundles = findModuleBundles(directories);
    const auto found = std::ranges::find(bundles, name, &fs::path::stem);
    return found == bundles.end() ? fs::path() : *found;
}

fs::path hostBundleDirectory(const fs::path& executable)
{
    return executable.parent_path().parent_path() / "share" / "orvane";
}

}  // namespace orvane
