// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/modules/ModuleSearch.h"
#include "orvane/support/settings/ValueJSON.h"

#include "orvane/support/files/WholeFile.h"

#include <nlohmann/json.hpp>

#include <sys/stat.h>
#include <unistd.h>

#include <fmt/format.h>
#include <algorithm>
#include <cerrno>
#include <sstream>

namespace orvane {
namespace {

namespace fs = std::filesystem;

constexpr const char* attempt = "load the module";

bool isPlainFileName(const fs::path& name)
{
    return !name.empty() && name == name.filename() && name != "." && name != "..";
}

/// Whoever owns the program itself could change that just as well: a module beside a program that
/// a user built is trusted when root runs the two.
bool isProgramOwner(uid_t owner)
{
    struct stat status = {};
    return ::stat("/proc/self/exe", &status) == 0 && status.st_uid == owner;
}

bool isTrustedOwner(uid_t owner)
{
    return owner == 0 || owner == ::geteuid() || isProgramOwner(owner);
}

// A group that only the user is in is the user; which groups are like that cannot be told, so of
// the groups only root's and the process's own are trusted.
bool isTrustedGroup(gid_t group)
{
    return group == 0 || group == ::getegid();
}

}  // namespace

std::vector<fs::path> moduleDirectories(const EnvironmentLookup& environment,
                                        const fs::path& executable)
{
    std::vector<fs::path> directories;
    std::istringstream named(environment("ORVANE_MODULE_PATH").value_or(""));
    for (std::string directory; std::getline(named, directory, ':');)
        if (fs::path(directory).is_absolute())
            directories.emplace_back(directory);
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

Outcome<ModuleDescription> readModuleDescription(const fs::path& bundle)
{
    const auto contents = readWholeFile(bundle / "module.json", 64U << 10U);
    if (const int* const error = std::get_if<int>(&contents))
        return cannot(attempt, bundle.native(), "module.json: " + errorText(*error));
    const auto json = parsedJSON(std::get<std::string>(contents));
    const auto text = [&json](const char* key, const char* otherwise) -> std::string {
        const auto found = json.find(key);
        return found != json.end() && found->is_string() ? found->get<std::string>() : otherwise;
    };
    if (!json.is_object() || text("name", "").empty())
        return cannot(attempt, bundle.native(), "module.json does not name the module");
    const fs::path library = text("library", "");
    if (!isPlainFileName(library))
        return cannot(attempt, bundle.native(), "module.json names no library inside the bundle");
    return ModuleDescription{text("name", ""), bundle / library, text("table", "FXW")};
}

fs::path hostBundleDirectory(const fs::path& executable)
{
    return executable.parent_path().parent_path() / "share" / "orvane";
}

Outcome<> checkIsTrustworthy(const fs::path& path)
{
    struct stat status = {};
    if (::stat(path.c_str(), &status) != 0)
        return cannot(attempt, path.native(), errno);
    if (!isTrustedOwner(status.st_uid))
        return cannot(attempt, path.native(),
                      fmt::format("it belongs to another user (number {})", status.st_uid));
    const bool othersMayWrite = (status.st_mode & S_IWOTH) != 0 ||
                                ((status.st_mode & S_IWGRP) != 0 && !isTrustedGroup(status.st_gid));
    if (othersMayWrite)
        return cannot(attempt, path.native(), "other users may change it");
    return Done();
}

}  // namespace orvane
