// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/tools/Tool.h"

#include <string_view>
#include <vector>

namespace pellar {

/// The tool for a file system by libblkid's name of it; null when there is none.
const Tool* toolFor(std::string_view filesystemType);

/// Every tool.
const std::vector<const Tool*>& allTools();

/// The tool for a volume whose kind is to be found out: the first that takes it for its own; null
/// when none does. `disk` is an open descriptor, `offset` where in it the volume begins.
const Tool* toolRecognizing(int disk, std::uint64_t offset, std::uint64_t availableBytes);

}  // namespace pellar
