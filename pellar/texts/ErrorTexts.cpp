// SPDX-License-Identifier: Apache-2.0
#include "pellar/texts/ErrorTexts.h"

#include "contract/foundation/Format.h"

#include <algorithm>

namespace pellar {

std::string_view errorTextKey(contract::ErrorCode code)
{
    const auto found =
        std::find_if(contract::errorTexts.begin(), contract::errorTexts.end(),
                     [code](const contract::ErrorText& text) { return text.code == code; });
    return found == contract::errorTexts.end() ? std::string_view() : found->key;
}

std::string errorText(contract::ErrorCode code, const Texts& texts)
{
    const std::string_view key = errorTextKey(code);
    return key.empty() ? contract::format(texts.text("Error %ld."), {code}) : texts.text(key);
}

}  // namespace pellar
