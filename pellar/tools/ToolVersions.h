// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/Stopping.h"

#include <string>
#include <string_view>
#include <vector>

namespace pellar {

/// A checking tool as it is on this system.
struct InstalledTool {
    std::string_view name;     ///< of the executable
    std::string_view package;  ///< the Debian package that brings it
    bool isInstalled = false;
    std::string version = {};  ///< empty where it does not say it, or took too long
};

/// Every checking tool. Each that is found in `toolPath` is run to tell its version, and is ended
/// after two silent seconds, or when `stop` asks. Blocks; any thread.
[[nodiscard]] std::vector<InstalledTool> installedTools(std::string_view toolPath,
                                                        StopSwitch& stop);

}  // namespace pellar
