// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/tools/Damage.h"

#include <string_view>
#include <vector>

namespace pellar {

/// What damage means to the owner of the files, gravest first: English texts, and text keys.
std::vector<std::string_view> meaningOf(Damage damage);

}  // namespace pellar
