// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/mounts/MountTable.h"

#include <string>
#include <vector>

namespace orvane {

/// Where the device with this node is mounted, in the order in which it was. Any thread.
[[nodiscard]] std::vector<pellar::Mount> placesOf(const std::string& node);

/// Who keeps these places busy, "name (number)", as far as this user may see; printable.
[[nodiscard]] std::string holdersText(const std::vector<pellar::Mount>& places);

}  // namespace orvane
