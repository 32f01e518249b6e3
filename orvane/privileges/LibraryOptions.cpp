// SPDX-License-Identifier: Apache-2.0
#include "orvane/privileges/LibraryOptions.h"

#include "orvane/support/modules/ModuleSearch.h"
#include "orvane/support/texts/Language.h"

#include <unistd.h>

namespace orvane {
namespace {

constexpr const char* authority = "/usr/bin/pkexec";

/// How the helper is started; empty for root, who needs none, and where it is not installed.
std::vector<std::string> helperLauncher()
{
    const auto helper =
        runningExecutable().parent_path().parent_path() / "libexec/orvane/pellar-helper";
    if (::geteuid() == 0 || ::access(authority, X_OK) != 0 || ::access(helper.c_str(), X_OK) != 0)
        return {};
    return {authority, helper.native()};
}

}  // namespace

pellar::ManagerOptions libraryOptions(const XDGPaths& paths, const pellar::Texts& texts,
                                      const Asking& asking)
{
    pellar::ManagerOptions options;
    if (const auto path = environmentValue("FIXWELL_TOOL_PATH"))
        options.toolPath = *path;
    options.homeDirectory = environmentValue("HOME").value_or("");
    if (!paths.state.empty()) {
        options.savedSectorsDirectory = paths.state / "partition-maps";
        options.permissionReferences = paths.state / "permissions";
    }
    const auto launcher = helperLauncher();
    if (!launcher.empty())
        options.privileged = [launcher, asking, &texts](const pellar::PrivilegedJob& job,
                                                        pellar::StopSwitch& stop,
                                                        pellar::EventRoad& road) {
            return std::make_unique<PrivilegedScript>(
                HelperLaunch{launcher, currentLanguages(), asking}, job, texts, stop, road);
        };
    return options;
}

}  // namespace orvane
