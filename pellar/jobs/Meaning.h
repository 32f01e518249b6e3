// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/tools/Damage.h"

#include <string_view>
#include <vector>

namespace pellar {

/// What damage means to the owner of the files, gravest first: English texts, and text keys.
/// They speak of a repair only where there is one.
std::vector<std::string_view> meaningOf(Damage damage, bool canBeRepaired = true);

}  // namespace pellar
