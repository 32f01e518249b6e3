// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/tools/Tool.h"

#include <string_view>
#include <vector>

namespace pellar {

/// The tool for a file system by libblkid's name of it; null when there is none.
const Tool* toolFor(std::string_view filesystemType);

/// Every tool, for a volume whose kind is to be found out.
const std::vector<const Tool*>& allTools();

}  // namespace pellar
