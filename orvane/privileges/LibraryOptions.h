// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/privileges/PrivilegedScript.h"
#include "orvane/support/files/Failure.h"
#include "orvane/support/settings/XDGPaths.h"
#include "pellar/jobs/JobOptions.h"
#include "pellar/texts/Texts.h"

namespace orvane {

/// Where repairs are tried and kept as root, in directories that are root's alone.
inline constexpr const char* systemRepairs = "/var/lib/orvane/repairs";

/// Where what this user's scheduled checks find is kept for others (orvane/jobs/PublishedChecks.h);
/// empty where the user has no directory.
[[nodiscard]] std::filesystem::path checksDirectory(const XDGPaths& paths);

/// How the disk-management library is set up for a user: where it looks for tools, where it keeps
/// what a repair overwrites and how much of it, and how it gets at disks for which the user has no
/// right. `texts` outlives the options. The repair policy is the stored settings'. `refused` (may
/// be empty) is told of directories of FIXWELL_TOOL_PATH that do not count, because others could
/// change what root would run from there.
[[nodiscard]] pellar::JobOptions libraryOptions(const XDGPaths& paths, const pellar::Texts& texts,
                                                const Asking& asking = {},
                                                const WarningSink& refused = {},
                                                const RepairAdvice& advice = {});

}  // namespace orvane
