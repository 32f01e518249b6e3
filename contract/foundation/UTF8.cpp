// SPDX-License-Identifier: Apache-2.0
#include "contract/foundation/UTF8.h"

#include <algorithm>

namespace contract {
namespace {

constexpr char32_t replacement = 0xFFFD;

struct Lead {
    std::size_t length;
    char32_t bits;
    char32_t smallest;  ///< anything below is an overlong form
};

Lead leadOf(unsigned char c)
{
    if (c < 0x80)
        return {1, c, 0};
    if (c >= 0xC2 && c <= 0xDF)
        return {2, c & 0x1FU, 0x80};
    if (c >= 0xE0 && c <= 0xEF)
        return {3, c & 0x0FU, 0x800};
    if (c >= 0xF0 && c <= 0xF4)
        return {4, c & 0x07U, 0x10000};
    return {0, 0, 0};
}

bool isHostile(char32_t c)
{
    const bool isControl = c < 0x20 || (c >= 0x7F && c < 0xA0);
    const bool isSeparator = c == 0x2028 || c == 0x2029;
    // Embeddings, overrides and isolates can make a name read as another one (UAX #9).
    const bool turnsDirection = (c >= 0x202A && c <= 0x202E) || (c >= 0x2066 && c <= 0x2069) ||
                                c == 0x200E || c == 0x200F || c == 0x061C;
    return isControl || isSeparator || turnsDirection;
}

}  // namespace

char32_t takeCharacter(std::string_view& text) noexcept
{
    const Lead lead = leadOf(static_cast<unsigned char>(text.front()));
    char32_t character = lead.bits;
    bool isValid = lead.length > 0 && lead.length <= text.size();
    for (std::size_t i = 1; isValid && i < lead.length; ++i) {
        const auto c = static_cast<unsigned char>(text[i]);
        isValid = (c & 0xC0U) == 0x80;
        character = (character << 6U) | (c & 0x3FU);
    }
    const bool isSurrogate = character >= 0xD800 && character <= 0xDFFF;
    isValid = isValid && character >= lead.smallest && character <= 0x10FFFF && !isSurrogate;
    text.remove_prefix(isValid ? lead.length : 1);
    return isValid ? character : replacement;
}

void appendUTF8(std::string& text, char32_t c)
{
    const auto byte = [&text](char32_t value) {
        text += static_cast<char>(value);
    };
    if (c < 0x80) {
        byte(c);
    } else if (c < 0x800) {
        byte(0xC0U | (c >> 6U));
        byte(0x80U | (c & 0x3FU));
    } else if (c < 0x10000) {
        byte(0xE0U | (c >> 12U));
        byte(0x80U | ((c >> 6U) & 0x3FU));
        byte(0x80U | (c & 0x3FU));
    } else {
        byte(0xF0U | (c >> 18U));
        byte(0x80U | ((c >> 12U) & 0x3FU));
        byte(0x80U | ((c >> 6U) & 0x3FU));
        byte(0x80U | (c & 0x3FU));
    }
}

std::string printable(std::string_view text)
{
    const bool isPlain =
        std::all_of(text.begin(), text.end(), [](char c) { return c >= 0x20 && c < 0x7F; });
    if (isPlain)
        return std::string(text);
    std::string result;
    result.reserve(text.size() + 8);
    forEachCharacter(text, [&result](char32_t character) {
        if (character == '\t')
            result += ' ';
        else
            appendUTF8(result, isHostile(character) ? replacement : character);
    });
    return result;
}

}  // namespace contract
