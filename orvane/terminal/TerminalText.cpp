// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/TerminalText.h"

#include "contract/foundation/UTF8.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <ctime>

namespace orvane {
namespace {

constexpr std::string_view reset = "\x1b[0m";

std::string lookOf(const contract::TextStyle& style)
{
    std::string look;
    if (style.font && style.font->isBold)
        look += "\x1b[1m";
    if (style.color && style.color->red > style.color->green)
        look += "\x1b[31m";
    else if (style.color && style.color->green > style.color->red)
        look += "\x1b[32m";
    return look;
}

/// The look is given up before each line end, so that no colour runs into what follows.
void appendLine(std::string& result, std::string_view line, const std::string& look)
{
    if (line.empty())
        return;
    result += look;
    result += contract::printable(line);
    if (!look.empty())
        result += reset;
}

constexpr int barCells = 24;

std::string repeated(std::string_view cell, int times)
{
    std::string text;
    for (int i = 0; i < times; ++i)
        text += cell;
    return text;
}

std::string bar(double percent)
{
    const int full = std::clamp(static_cast<int>(percent / 100 * barCells), 0, barCells);
    return repeated("█", full) + repeated("░", barCells - full) +
           fmt::format(" {:3.0f} %", std::clamp(percent, 0.0, 100.0));
}

/// A mark that moves by one cell of the bar each second.
std::string wanderingMark(std::chrono::seconds elapsed)
{
    const int at = static_cast<int>(elapsed.count() % barCells);
    return repeated("░", at) + "█" + repeated("░", barCells - at - 1) +
           fmt::format(" {}:{:02}", elapsed.count() / 60, elapsed.count() % 60);
}

}  // namespace

std::string safeLines(std::string_view text)
{
    std::string result;
    while (!text.empty()) {
        const std::size_t end = std::min(text.find('\n'), text.size());
        result += contract::printable(text.substr(0, end));
        if (end < text.size())
            result += '\n';
        text.remove_prefix(std::min(end + 1, text.size()));
    }
    return result;
}

std::string terminalText(const contract::StyledText& text, bool colors)
{
    if (!colors)
        return safeLines(text.characters());
    std::string result;
    std::string_view rest = text.characters();
    for (const contract::StyledText::Run& run : text.runs()) {
        const std::string look = lookOf(*run.style);
        std::string_view part = rest.substr(0, run.length);
        rest.remove_prefix(run.length);
        while (!part.empty()) {
            const std::size_t end = std::min(part.find('\n'), part.size());
            appendLine(result, part.substr(0, end), look);
            if (end < part.size())
                result += '\n';
            part.remove_prefix(std::min(end + 1, part.size()));
        }
    }
    return result;
}

std::string shellWord(std::string_view text)
{
    constexpr std::string_view plain =
        "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789/._-+:=,@%";
    // What begins with a dash would be an option.
    const std::string shown = (text.starts_with('-') ? "./" : "") + contract::printable(text);
    if (!shown.empty() && shown.find_first_not_of(plain) == std::string::npos)
        return shown;
    std::string word = "'";
    for (const char character : shown)
        word += character == '\'' ? std::string("'\\''") : std::string(1, character);
    return word + "'";
}

std::string progressLine(const JobProgress& progress, std::size_t columns)
{
    const std::string gauge =
        progress.percent ? bar(*progress.percent) : wanderingMark(progress.elapsed);
    return fittedTo(gauge + "  " + contract::printable(progress.status), columns);
}

}  // namespace orvane
