// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Dictionary.h"
#include "contract/foundation/StyledText.h"
#include "fixwell/Contract.h"

namespace fixwell {

inline constexpr double messageFontPoints = 11;

inline constexpr Color standardErrorColor{1.0, 0.0, 0.0, 1.0};
inline constexpr Color standardPassColor{0.0, 0.8, 0.2, 1.0};

/// How a record looks: bold for headings, red for problems and failures, green for good results.
TextStyle messageStyle(const Dictionary& record, const Color& errorColor, const Color& passColor);

}  // namespace fixwell
