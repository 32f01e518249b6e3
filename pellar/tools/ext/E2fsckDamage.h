// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Damage.h"

#include <string_view>

namespace pellar {

/// What a problem that e2fsck names means. A line that is not known counts as damaged contents:
/// rather too grave than too light.
Damage e2fsckDamageOf(std::string_view problem);

}  // namespace pellar
