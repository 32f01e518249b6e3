// SPDX-License-Identifier: Apache-2.0
#include "contract/foundation/StyledText.h"

#include "contract/foundation/Storage.h"
#include "contract/foundation/UTF8.h"

#include <algorithm>
#include <atomic>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <limits>
#include <memory>
#include <mutex>
#include <new>
#include <utility>
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

namespace {

// What the allocator would round up to anyway is room for an addition: most lines get an end.
constexpr std::size_t roundedSize(std::size_t size)
{
    constexpr std::size_t step = 16;
    constexpr std::size_t head = sizeof(std::size_t);  // the allocator's own
    return (size + head + step - 1) / step * step - head;
}

}  // namespace

StyledText::Storage* StyledText::Storage::make(std::string_view text, const TextStyle* style)
{
    // A log holds millions: a field more would cost sixteen bytes.
    static_assert(sizeof(Storage) == 16);
    constexpr std::size_t mostRoom = 0x7F;
    const bool fits = text.size() <= std::numeric_limits<std::uint16_t>::max() - mostRoom;
    const std::string_view here = fits ? text : std::string_view();
    const std::size_t size = roundedSize(sizeof(Storage) + here.size() + 1);
    auto* const storage = new (::operator new(size)) Storage(style);
    here.copy(storage->characters(), here.size());
    storage->length = static_cast<std::uint16_t>(here.size());
    storage->room = static_cast<std::uint8_t>(size - sizeof(Storage) - here.size()) & mostRoom;
    if (!fits)
        storage->addText(text);
    return storage;
}

void StyledText::Storage::destroy(Storage* storage) noexcept
{
    if (storage->hasMoved)
        delete storage->moved;
    std::destroy_at(storage);
    ::operator delete(storage);
}

std::string_view StyledText::Storage::text() const noexcept
{
    if (hasMoved)
        return moved->text;
    return {characters(), length};
}

void StyledText::Storage::setStyle(const TextStyle* style) noexcept
{
    (hasMoved ? moved->style : ownStyle) = style;
}

void StyledText::Storage::addRuns(const std::vector<Run>& added)
{
    std::vector<Run>& runs = moveOut().runs;
    if (runs.empty() && !text().empty())
        runs.push_back({text().size(), style()});
    for (const Run& run : added) {
        if (!runs.empty() && runs.back().style == run.style)
            runs.back().length += run.length;
        else
            runs.push_back(run);
    }
}

// What is added may be a part of this text.
void StyledText::Storage::addText(std::string_view added)
{
    if (hasMoved || added.size() > room) {
        moveOut().text.append(added);
        return;
    }
    added.copy(characters() + length, added.size());
    length = static_cast<std::uint16_t>(length + added.size());
    room = static_cast<std::uint8_t>(room - added.size()) & 0x7FU;
}

StyledText::Storage::Moved& StyledText::Storage::moveOut()
{
    if (!hasMoved) {
        moved = new Moved{std::string(text()), {}, ownStyle};
        hasMoved = true;
    }
    return *moved;
}

StyledText::Storage* StyledText::storage() const noexcept
{
    return static_cast<Storage*>(node_.get());
}

StyledText StyledText::make(std::string_view characters, const TextStyle& style)
{
    return StyledText(NodePointer<Node>::adopting(Storage::make(characters, interned(style))));
}

StyledText StyledText::copy() const
{
    StyledText copy;
    if (node_)
        copy = StyledText(
            NodePointer<Node>::adopting(Storage::make(storage()->text(), storage()->style())));
    if (node_ && storage()->hasRuns())
        copy.storage()->moveOut().runs = storage()->moved->runs;
    return copy;
}

std::string_view StyledText::characters() const noexcept
{
    return node_ ? storage()->text() : std::string_view();
}

std::vector<StyledText::Run> StyledText::runs() const
{
    if (isEmpty())
        return {};
    return storage()->hasRuns() ? storage()->moved->runs
                                : std::vector<Run>{{storage()->text().size(), storage()->style()}};
}

const TextStyle& StyledText::style() const noexcept
{
    static const TextStyle plain;
    return node_ ? *storage()->style() : plain;
}

void StyledText::append(std::string_view characters) const
{
    if (storage()->hasRuns())
        storage()->moved->runs.back().length += characters.size();
    storage()->addText(characters);
}

void StyledText::append(const StyledText& other) const
{
    if (other.isEmpty())
        return;
    if (isEmpty())
        storage()->setStyle(other.storage()->style());
    const bool isOneStyle = !storage()->hasRuns() && !other.storage()->hasRuns() &&
                            storage()->style() == other.storage()->style();
    if (!isOneStyle)
        storage()->addRuns(other.runs());
    storage()->addText(other.characters());
}

void StyledText::addAttributes(const TextStyle& style) const
{
    storage()->setStyle(interned(storage()->style()->with(style)));
    if (storage()->hasRuns())
        for (Run& run : storage()->moved->runs)
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
