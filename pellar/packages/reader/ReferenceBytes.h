// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/packages/Reference.h"

#include <optional>
#include <string>
#include <string_view>

namespace pellar {

/// References on their way from one process to another.
std::string bytesOf(const References& references);

/// None unless all of it is such as a reading may answer: whoever wrote it may be in the hands of
/// the database that it read.
[[nodiscard]] std::optional<References> referencesIn(std::string_view bytes);

}  // namespace pellar
