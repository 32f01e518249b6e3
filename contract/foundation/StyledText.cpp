// SPDX-License-Identifier: Apache-2.0
#include "contract/foundation/StyledText.h"

#include "contract/foundation/Storage.h"
#include "contract/foundation/UTF8.h"

#include <algorithm>
#include <atomic>
#include <cstdint>
#include <deque>
#include <mutex>
#include <vector>

namespace contract {
namespace {

/// A log knows a dozen styles at most, so a short walk finds the one; the last answer comes
/// first, because a burst of lines has one look.
const TextStyle* interned(const TextStyle& style)
{
    static std::mutex lock;
    static auto* const styles = new std::deque<TextStyle>;
    static std::atomic<const TextStyle*> recent = nullptr;

    const TextStyle* const latest = recent.load(std::memory_order_acquire);
    if (latest != nullptr && *latest == style)
        return latest;
    const std::lock_guard guard(lock);
    const auto found = std::find(styles->begin(), styles->end(), style);
    const TextStyle* const one = found != styles->end() ? &*found : &styles->emplace_back(style);
    recent.store(one, std::memory_order_release);
    return one;
}

}  // namespace

TextStyle TextStyle::with(const TextStyle& other) const
{
    return {other.font ? other.font : font, other.color ? other.color : color,
            other.paragraph ? other.paragraph : paragraph};
}

StyledText::Storage::Storage(const Storage& other)
    : Node(Kind::StyledText),
      style(other.style),
      runs(other.runs ? std::make_unique<std::vector<Run>>(*other.runs) : nullptr),
      text(other.text)
{
}

StyledText::Storage* StyledText::storage() const noexcept
{
    return static_cast<Storage*>(node_.get());
}

StyledText StyledText::make(std::string_view characters, const TextStyle& style)
{
    return StyledText(NodePointer<Node>::adopting(new Storage(characters, interned(style))));
}

StyledText StyledText::copy() const
{
    return node_ ? StyledText(NodePointer<Node>::adopting(new Storage(*storage()))) : StyledText();
}

std::string_view StyledText::characters() const noexcept
{
    return node_ ? std::string_view(storage()->text) : std::string_view();
}

std::vector<StyledText::Run> StyledText::runs() const
{
    if (isEmpty())
        return {};
    return storage()->runs ? *storage()->runs
                           : std::vector<Run>{{storage()->text.size(), storage()->style}};
}

const TextStyle& StyledText::style() const noexcept
{
    static const TextStyle plain;
    return node_ ? *storage()->style : plain;
}

void StyledText::append(std::string_view characters) const
{
    storage()->text += characters;
    if (storage()->runs)
        storage()->runs->back().length += characters.size();
}

void StyledText::append(const StyledText& other) const
{
    if (other.isEmpty())
        return;
    if (isEmpty()) {
        storage()->text = other.characters();
        storage()->style = other.storage()->style;
        storage()->runs = other.storage()->runs
                              ? std::make_unique<std::vector<Run>>(*other.storage()->runs)
                              : nullptr;
        return;
    }
    const bool isOneStyle =
        !storage()->runs && !other.storage()->runs && storage()->style == other.storage()->style;
    if (!isOneStyle) {
        std::vector<Run> joined = runs();
        for (const Run& run : other.runs()) {
            if (joined.back().style == run.style)
                joined.back().length += run.length;
            else
                joined.push_back(run);
        }
        storage()->runs = std::make_unique<std::vector<Run>>(std::move(joined));
    }
    storage()->text += std::string(other.characters());
}

void StyledText::addAttributes(const TextStyle& style) const
{
    storage()->style = interned(storage()->style->with(style));
    if (storage()->runs)
        for (Run& run : *storage()->runs)
            run.style = interned(run.style->with(style));
}

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
