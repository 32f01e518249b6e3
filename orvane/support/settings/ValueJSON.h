// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/StyledText.h"
#include "contract/foundation/Value.h"

#include <nlohmann/json.hpp>

#include <string_view>

namespace orvane {

// Values as JSON and back, with their kinds, the order of dictionaries and any bytes in strings.
// Flags, integers, finite reals, arrays and strings that are UTF-8 are the JSON things of that
// name; everything else is an object with one tag:
//   {"bytes": "66ff"}      a string that is no UTF-8, in hexadecimal
//   {"real": "nan"}        a real number that JSON cannot write
//   {"dictionary": [["key", value], ...]}
//   {"styled": [["characters", style], ...]}
// An object with an identity (a disk) cannot be stored; its description is, as a string.

/// Discarded when it is no JSON, or nested deeper than anything that is written by us.
[[nodiscard]] nlohmann::json parsedJSON(std::string_view text);

[[nodiscard]] nlohmann::json jsonFromValue(const contract::Value& value);
/// No value for null and for what jsonFromValue never writes.
[[nodiscard]] contract::Value valueFromJSON(const nlohmann::json& json);

[[nodiscard]] nlohmann::json jsonFromStyle(const contract::TextStyle& style);
[[nodiscard]] contract::TextStyle styleFromJSON(const nlohmann::json& json);

}  // namespace orvane
