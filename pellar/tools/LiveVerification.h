// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/tools/Capability.h"

#include <string_view>

namespace pellar {

/// Whether a volume of this kind, as libblkid names it, can be verified while it stays mounted and
/// is written to: with an answer that is true, by a tool that is there. It needs root.
[[nodiscard]] Capability liveCapabilityFor(std::string_view filesystemType,
                                           std::string_view toolPath);

}  // namespace pellar
