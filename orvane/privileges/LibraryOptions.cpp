// SPDX-License-Identifier: Apache-2.0
#include "orvane/privileges/LibraryOptions.h"

#include "orvane/jobs/PublishedChecks.h"
#include "orvane/privileges/MountedSystem.h"
#include "orvane/support/files/WholeFile.h"
#include "orvane/support/modules/ModuleSearch.h"
#include "orvane/support/settings/RepairSettings.h"
#include "orvane/support/settings/SettingsFile.h"
#include "orvane/support/texts/Language.h"

#include <sys/stat.h>
#include <unistd.h>

#include <chrono>

namespace orvane {
namespace {

constexpr const char* authority = "/usr/bin/pkexec";

bool isRootsAlone(const std::filesystem::path& program)
{
    struct stat status = {};
    return ::lstat(program.c_str(), &status) == 0 && S_ISREG(status.st_mode) &&
           status.st_uid == 0 && (status.st_mode & (S_IWGRP | S_IWOTH)) == 0 &&
           isWayOfRootsAlone(program);
}

/// How the helper is started; empty for root, who needs none, and where it is not installed. One
/// that a user has built is not offered: an administrator's password would run what that user may
/// change.
std::vector<std::string> helperLauncher()
{
    const auto helper =
        runningExecutable().parent_path().parent_path() / "libexec/orvane/pellar-helper";
    if (::geteuid() == 0 || ::access(authority, X_OK) != 0 || ::access(helper.c_str(), X_OK) != 0 ||
        !isRootsAlone(helper))
        return {};
    return {authority, helper.native()};
}

/// Empty where the variable names nothing that may be used.
std::string toolPathFromEnvironment(const WarningSink& refused)
{
    std::string path;
    for (const auto& directory : directoriesNamedBy("FIXWELL_TOOL_PATH", environmentValue, refused))
        path += (path.empty() ? "" : ":") + directory.native();
    return path;
}

/// Root works for all, unless other directories are asked for.
bool worksForAll(const XDGPaths& paths)
{
    return ::geteuid() == 0 && !environmentValue("XDG_STATE_HOME") &&
           paths.state == userXDGPaths().state;
}

/// Root's repairs are kept with those that the helper makes for others, so that root sees them all.
std::filesystem::path repairsDirectory(const XDGPaths& paths)
{
    if (worksForAll(paths))
        return systemRepairs;
    return fileIn(paths.state, "repairs");
}

void setTrials(pellar::JobOptions& options, const XDGPaths& paths, const RepairAdvice& advice)
{
    const std::filesystem::path file = fileIn(paths.config, settingsFileName);
    options.trials.room.directory = repairsDirectory(paths);
    options.trials.isPublic = options.trials.room.directory == systemRepairs;
    if (::geteuid() != 0)
        options.trials.systemDirectory = systemRepairs;
    // Read anew, because they may be changed while the program runs.
    options.trials.limits = [file] {
        const RepairSettings settings = readRepairSettings(file);
        return pellar::RecordLimits{settings.keptRepairs,
                                    std::chrono::hours(24 * settings.keptRepairDays),
                                    settings.keptRepairMegabytes << 20U};
    };
    options.trials.howToUndo = advice.undo;
    options.trials.howToUndoPermissions = advice.undoPermissions;
    options.trials.howToApply = advice.apply;
    options.trials.howToRepairDirectly = advice.repairDirectly;
    options.repairPolicy = [isThorough = readRepairSettings(file).thoroughVerification] {
        pellar::RepairPolicy policy;
        policy.isThorough = isThorough;
        return policy;
    };
}

}  // namespace

std::filesystem::path checksDirectory(const XDGPaths& paths)
{
    return worksForAll(paths) ? std::filesystem::path(systemChecks) : fileIn(paths.state, "checks");
}

pellar::JobOptions libraryOptions(const XDGPaths& paths, const pellar::Texts& texts,
                                  const Asking& asking, const WarningSink& refused,
                                  const RepairAdvice& advice)
{
    pellar::JobOptions options;
    if (const std::string path = toolPathFromEnvironment(refused); !path.empty())
        options.toolPath = path;
    options.homeDirectory = environmentValue("HOME").value_or("");
    if (!paths.state.empty())
        options.permissionReferences = paths.state / "permissions";
    setTrials(options, paths, advice);
    const auto launcher = helperLauncher();
    if (!launcher.empty())
        options.privileged = [launcher, asking, advice, &texts](const pellar::PrivilegedJob& job,
                                                                pellar::StopSwitch& stop,
                                                                pellar::EventQueue& events) {
            return std::make_unique<PrivilegedScript>(
                HelperLaunch{launcher, currentLanguages(), asking, advice}, job, texts, stop,
                events);
        };
    return options;
}

}  // namespace orvane
