// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <algorithm>
#include <string_view>

namespace pellar {

/// What stands before the separator, which goes with it; all that is left where there is none.
inline std::string_view takeField(std::string_view& text, char separator)
{
    const std::size_t length = std::min(text.find(separator), text.size());
    const std::string_view field = text.substr(0, length);
    text.remove_prefix(std::min(length + 1, text.size()));
    return field;
}

/// The next word between blanks; empty at the end.
inline std::string_view takeWord(std::string_view& text)
{
    text.remove_prefix(std::min(text.find_first_not_of(" \t"), text.size()));
    const std::size_t length = std::min(text.find_first_of(" \t"), text.size());
    const std::string_view word = text.substr(0, length);
    text.remove_prefix(length);
    return word;
}

template <class Function>
void forEachLine(std::string_view text, Function&& function)
{
    while (!text.empty())
        function(takeField(text, '\n'));
}

}  // namespace pellar
