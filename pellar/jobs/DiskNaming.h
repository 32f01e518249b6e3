// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

namespace pellar {

/// The name under which a tool opens the disk that it inherits. No name of the user's ever
/// stands in a command.
std::string diskArgumentOfTool();

/// A tool's line with that name, and the offset that may follow it, replaced by the disk's own.
std::string withDiskName(std::string_view line, std::string_view diskName);

}  // namespace pellar
