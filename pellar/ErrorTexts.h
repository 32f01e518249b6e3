// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/host/pellar/ErrorCodes.h"
#include "pellar/Texts.h"

#include <string>
#include <string_view>

namespace pellar {

/// The English text, and text key, of an error code. Empty for 0 and for codes that are nobody's.
std::string_view errorTextKey(fixwell::ErrorCode code);

/// The same in the user's language; a code without a text is shown by its number. Never empty.
std::string errorText(fixwell::ErrorCode code, const Texts& texts);

}  // namespace pellar
