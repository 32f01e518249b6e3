// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Value.h"

#include <string>
#include <string_view>

namespace orvane {

/// A number in the decimal style of a language ("de", "de_CH", empty for English): grouped by
/// thousands, with at most three decimals. The separators are those of the Unicode CLDR for the
/// common languages, and English ones for any other; the system's locales are not asked, because
/// a rescue system has none. Anything but a number reads as 0.
[[nodiscard]] std::string decimalText(const contract::Value& number, std::string_view language);

}  // namespace orvane
