// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/privileges/PrivilegedScript.h"
#include "orvane/support/settings/XDGPaths.h"
#include "pellar/ManagerOptions.h"
#include "pellar/Texts.h"

namespace orvane {

/// How the disk-management library is set up for a user: where it looks for tools, where it keeps
/// what a repair overwrites, and how it gets at disks for which the user has no right. `texts`
/// outlives the options.
[[nodiscard]] pellar::ManagerOptions libraryOptions(const XDGPaths& paths,
                                                    const pellar::Texts& texts,
                                                    const Asking& asking = {});

}  // namespace orvane
