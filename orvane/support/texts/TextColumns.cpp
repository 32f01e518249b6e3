// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/texts/TextColumns.h"

#include "contract/foundation/UTF8.h"

#include <cwchar>

namespace orvane {
namespace {

constexpr std::string_view blanks = " \t\r\n";

// The most common of JIS X 4051's characters that may not begin, or end, a line.
constexpr std::u32string_view neverFirst =
    U"、。，．・：；？！」』）］｝】〉》”’ー々ぁぃぅぇぉっゃゅょァィゥェォッャュョ";
constexpr std::u32string_view neverLast = U"「『（［｛【〈《“‘";

bool isWide(char32_t character)
{
    return columnsOf(character) == 2;
}

bool mayBreakBetween(char32_t before, char32_t after)
{
    return (isWide(before) || isWide(after)) &&
           neverLast.find(before) == std::u32string_view::npos &&
           neverFirst.find(after) == std::u32string_view::npos;
}

}  // namespace

std::size_t columnsOf(char32_t character)
{
    const int columns = ::wcwidth(static_cast<wchar_t>(character));
    return columns < 0 ? 1 : static_cast<std::size_t>(columns);
}

std::size_t columnsOf(std::string_view text)
{
    std::size_t columns = 0;
    contract::forEachCharacter(text, [&](char32_t character) { columns += columnsOf(character); });
    return columns;
}

std::string fittedTo(std::string_view text, std::size_t columns)
{
    std::string fitted;
    while (!text.empty()) {
        const char32_t character = contract::takeCharacter(text);
        const std::size_t width = columnsOf(character);
        if (width > columns)
            break;
        columns -= width;
        contract::appendUTF8(fitted, character);
    }
    return fitted;
}

std::vector<std::string_view> breakablePieces(std::string_view text)
{
    std::vector<std::string_view> pieces;
    std::string_view rest = text;
    const char* begin = text.data();
    const auto end = [&](const char* at) {
        if (at != begin)
            pieces.emplace_back(begin, static_cast<std::size_t>(at - begin));
        begin = at;
    };
    char32_t before = 0;
    while (!rest.empty()) {
        const char* const at = rest.data();
        const char32_t character = contract::takeCharacter(rest);
        if ((before == U' ' && character != U' ') ||
            (before != 0 && character != U' ' && mayBreakBetween(before, character)))
            end(at);
        before = character;
    }
    end(text.data() + text.size());
    return pieces;
}

std::string joinedLines(std::string_view text)
{
    std::string joined;
    char32_t before = 0;
    bool hasBlank = false;
    bool hasLineEnd = false;
    while (!text.empty()) {
        if (blanks.find(text.front()) != std::string_view::npos) {
            hasBlank = true;
            hasLineEnd = hasLineEnd || text.front() == '\n';
            text.remove_prefix(1);
            continue;
        }
        const char32_t character = contract::takeCharacter(text);
        const bool isOneWord = hasLineEnd && before != 0 && isWide(before) && isWide(character);
        if (hasBlank && !isOneWord)
            joined += ' ';
        contract::appendUTF8(joined, character);
        before = character;
        hasBlank = hasLineEnd = false;
    }
    if (hasBlank)
        joined += ' ';
    return joined;
}

}  // namespace orvane
