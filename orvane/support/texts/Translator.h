// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Format.h"

#include <functional>
#include <initializer_list>
#include <string>
#include <string_view>

namespace orvane {

/// How the host's own sentences get into the user's language. Any thread. The key is the English
/// text; without a translation it is also the answer.
struct Translator {
    std::function<std::string(std::string_view key)> text = [](std::string_view key) {
        return std::string(key);
    };
    /// The form of the language for `count` things.
    std::function<std::string(std::string_view one, std::string_view many, long count)> plural =
        [](std::string_view one, std::string_view many, long count) {
            return std::string(count == 1 ? one : many);
        };

    /// The translated format filled with arguments (contract/foundation/Format.h).
    std::string sentence(std::string_view key,
                         std::initializer_list<contract::FormatArgument> arguments) const
    {
        return contract::format(text(key), arguments);
    }
};

}  // namespace orvane
