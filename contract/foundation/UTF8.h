// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace contract {

/// Takes the first character off `text`, which must not be empty. Anything that is no UTF-8
/// (RFC 3629: overlong forms, surrogates, beyond U+10FFFF, cut off) costs one byte and is U+FFFD.
char32_t takeCharacter(std::string_view& text) noexcept;

template <class Function>
void forEachCharacter(std::string_view text, Function&& function)
{
    while (!text.empty())
        function(takeCharacter(text));
}

void appendUTF8(std::string& text, char32_t character);

/// `text` fit to be shown on one line: control characters (C0, DEL, C1), line and paragraph
/// separators and the marks that turn the writing direction become U+FFFD, as does what is no
/// UTF-8. A tab becomes a space. Text without any of these comes back as it is.
std::string printable(std::string_view text);

}  // namespace contract
