// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string_view>

namespace orvane {

/// Files on this kind of file system (as libblkid or the kernel names it) have owners of their own.
/// NO for an unknown one: Linux then makes an owner up for all of them (mount(8), "uid=").
[[nodiscard]] bool hasOwners(std::string_view filesystemType);

}  // namespace orvane
