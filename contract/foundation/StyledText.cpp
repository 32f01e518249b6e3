// SPDX-License-Identifier: Apache-2.0
#include "contract/foundation/StyledText.h"

#include "contract/foundation/Storage.h"

#include <algorithm>
#include <atomic>
#include <deque>
#include <mutex>

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

}  // namespace contract
