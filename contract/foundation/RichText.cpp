// SPDX-License-Identifier: Apache-2.0
#include "contract/foundation/RichText.h"

#include "contract/foundation/UTF8.h"

#include <algorithm>
#include <cstdint>
#include <vector>

namespace contract {
namespace {

std::vector<Color> colorsOf(const std::vector<StyledText::Run>& runs)
{
    std::vector<Color> colors;
    for (const StyledText::Run& run : runs)
        if (run.style->color &&
            std::find(colors.begin(), colors.end(), *run.style->color) == colors.end())
            colors.push_back(*run.style->color);
    return colors;
}

std::string colorTable(const std::vector<Color>& colors)
{
    // Entry 0 is the reader's own text colour; ours count from 1.
    std::string table = "{\\colortbl;";
    const auto level = [](double part) {
        const bool isPart = part > 0;  // NO for what is no number, too
        return std::to_string(isPart ? static_cast<int>(std::min(part, 1.0) * 255 + 0.5) : 0);
    };
    for (const Color& color : colors)
        table += "\\red" + level(color.red) + "\\green" + level(color.green) + "\\blue" +
                 level(color.blue) + ";";
    return table + "}\n";
}

void appendCharacter(std::string& rtf, char32_t character)
{
    if (character == '\n') {
        rtf += "\\par\n";
    } else if (character == '\t') {
        rtf += "\\tab ";
    } else if (character == '\\' || character == '{' || character == '}') {
        rtf += '\\';
        rtf += static_cast<char>(character);
    } else if (character >= 0x20 && character < 0x7F) {
        rtf += static_cast<char>(character);
    } else if (character >= 0xA0) {
        // \uN takes a signed 16-bit unit and a substitute for readers that know no Unicode.
        const auto unit = [&rtf](char32_t value) {
            rtf += "\\u" + std::to_string(static_cast<std::int16_t>(value)) + "?";
        };
        if (character < 0x10000) {
            unit(character);
        } else {
            unit(0xD800 + ((character - 0x10000) >> 10U));
            unit(0xDC00 + ((character - 0x10000) & 0x3FFU));
        }
    }
}

std::string styleCommands(const TextStyle& style, const std::vector<Color>& colors)
{
    std::string commands = "\\f0";
    if (style.font) {
        commands += style.font->isBold ? "\\b" : "\\b0";
        commands +=
            "\\fs" + std::to_string(static_cast<int>(style.font->points * 2 + 0.5));  // half-points
    }
    const auto found =
        style.color ? std::find(colors.begin(), colors.end(), *style.color) : colors.end();
    const auto entry = found == colors.end() ? 0 : found - colors.begin() + 1;
    return commands + "\\cf" + std::to_string(entry) + " ";
}

}  // namespace

std::string rtf(const StyledText& text)
{
    const std::vector<StyledText::Run> runs = text.runs();
    const std::vector<Color> colors = colorsOf(runs);
    std::string result =
        "{\\rtf1\\ansi\\uc1{\\fonttbl{\\f0\\fswiss Helvetica;}}\n" + colorTable(colors);
    std::size_t start = 0;
    for (const StyledText::Run& run : runs) {
        result += "{" + styleCommands(*run.style, colors);
        forEachCharacter(text.characters().substr(start, run.length),
                         [&result](char32_t character) { appendCharacter(result, character); });
        result += "}";
        start += run.length;
    }
    return result + "}";
}

std::string rtfd(const StyledText& text)
{
    return rtf(text);
}

}  // namespace contract
