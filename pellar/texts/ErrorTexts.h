// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/pellar/ErrorCodes.h"
#include "pellar/texts/Texts.h"

#include <string>
#include <string_view>

namespace pellar {

/// The English text, and text key, of an error code. Empty for 0 and for unknown codes.
std::string_view errorTextKey(contract::ErrorCode code);

/// The same in the user's language; a code without a text is shown by its number. Never empty.
std::string errorText(contract::ErrorCode code, const Texts& texts);

}  // namespace pellar
