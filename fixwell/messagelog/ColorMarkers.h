// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/Contract.h"

#include <string_view>

namespace fixwell {

/// Whether the tool marked the line red ("[31m" anywhere, without its escape byte).
bool scanForSpecialChars(std::string_view line);

/// The text between "[31m" and the first "[0m" (or, where there is none, "[30m") of the line.
/// An escape byte before the end marker stays. A line without both markers, or with the end
/// before the start, comes back whole.
std::string_view removeSpecialChars(std::string_view line);

}  // namespace fixwell
