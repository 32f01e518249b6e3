// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <algorithm>
#include <charconv>
#include <cstddef>
#include <optional>
#include <string_view>

namespace orvane {

/// Letters and digits of ASCII and these `signs`, and no more than `longest` of them.
[[nodiscard]] inline bool consistsOf(std::string_view text, std::string_view signs,
                                     std::size_t longest)
{
    const auto isAllowed = [signs](char character) {
        return (character >= 'a' && character <= 'z') || (character >= 'A' && character <= 'Z') ||
               (character >= '0' && character <= '9') ||
               signs.find(character) != std::string_view::npos;
    };
    return text.size() <= longest && std::all_of(text.begin(), text.end(), isAllowed);
}

/// The number that the whole of the text is, in digits and, below zero, a minus sign; none when it
/// is none, or one that Number cannot hold.
template <class Number>
[[nodiscard]] std::optional<Number> numberIn(std::string_view text)
{
    Number number = 0;
    const char* const end = text.data() + text.size();
    const auto [rest, error] = std::from_chars(text.data(), end, number);
    return error == std::errc() && rest == end ? std::optional(number) : std::nullopt;
}

}  // namespace orvane
