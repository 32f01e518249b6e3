// SPDX-License-Identifier: Apache-2.0
#include "contract/foundation/PhraseMatcher.h"

#include <algorithm>
#include <deque>

namespace contract {
namespace {

constexpr unsigned char lowered(unsigned char c)
{
    return c >= 'A' && c <= 'Z' ? static_cast<unsigned char>(c + 32) : c;
}

constexpr bool isWithin(char32_t c, char32_t first, char32_t last)
{
    return c >= first && c <= last;
}

/// The lower-case letter of a code point from two bytes of UTF-8. Only letters whose partner is
/// two bytes long as well, so folding keeps every position (Unicode, CaseFolding.txt).
constexpr char32_t loweredWide(char32_t c)
{
    if ((isWithin(c, 0xC0, 0xDE) && c != 0xD7) || (isWithin(c, 0x391, 0x3AB) && c != 0x3A2) ||
        isWithin(c, 0x410, 0x42F))
        return c + 32;
    if (isWithin(c, 0x400, 0x40F))
        return c + 80;
    switch (c) {
        case 0x178: return 0xFF;
        case 0x386: return 0x3AC;
        case 0x388:
        case 0x389:
        case 0x38A: return c + 37;
        case 0x38C: return 0x3CC;
        case 0x38E:
        case 0x38F: return c + 63;
        case 0x3C2: return 0x3C3;  // the sigma at the end of a word
        case 0x4C0: return 0x4CF;
        default: break;
    }
    const bool evenIsUpper = isWithin(c, 0x100, 0x12F) || isWithin(c, 0x132, 0x137) ||
                             isWithin(c, 0x14A, 0x177) || isWithin(c, 0x3D8, 0x3EF) ||
                             isWithin(c, 0x460, 0x481) || isWithin(c, 0x48A, 0x4BF) ||
                             isWithin(c, 0x4D0, 0x4FF);
    const bool oddIsUpper =
        isWithin(c, 0x139, 0x148) || isWithin(c, 0x179, 0x17E) || isWithin(c, 0x4C1, 0x4CE);
    if ((evenIsUpper && c % 2 == 0) || (oddIsUpper && c % 2 == 1))
        return c + 1;
    return c;
}

bool hasLeadOfTwo(std::string_view text)
{
    return std::any_of(text.begin(), text.end(),
                       [](char c) { return isWithin(static_cast<unsigned char>(c), 0xC2, 0xDF); });
}

}  // namespace

std::string foldedCase(std::string_view text)
{
    std::string folded(text);
    for (std::size_t i = 0; i < folded.size(); ++i) {
        const auto c = static_cast<unsigned char>(folded[i]);
        folded[i] = static_cast<char>(lowered(c));
        const bool isPair = isWithin(c, 0xC2, 0xDF) && i + 1 < folded.size() &&
                            (static_cast<unsigned char>(folded[i + 1]) & 0xC0U) == 0x80;
        if (!isPair)
            continue;
        const char32_t letter =
            ((c & 0x1FU) << 6U) | (static_cast<unsigned char>(folded[i + 1]) & 0x3FU);
        const char32_t lower = loweredWide(letter);
        folded[i] = static_cast<char>(0xC0U | (lower >> 6U));
        folded[++i] = static_cast<char>(0x80U | (lower & 0x3FU));
    }
    return folded;
}

PhraseMatcher::PhraseMatcher(std::span<const std::string> phrases)
{
    for (const std::string& phrase : phrases) {
        hasWideLetters_ = hasWideLetters_ || hasLeadOfTwo(phrase);
        for (const char c : foldedCase(phrase)) {
            std::uint8_t& byteClass = classOf_[static_cast<unsigned char>(c)];
            if (byteClass == 0)
                byteClass = static_cast<std::uint8_t>(classes_++);
        }
    }
    for (unsigned char c = 'A'; c <= 'Z'; ++c)
        classOf_[c] = classOf_[lowered(c)];

    next_.assign(classes_, 0);
    found_.assign(1, noPhrase);
    for (std::size_t i = 0; i < phrases.size(); ++i)
        addPhrase(foldedCase(phrases[i]), static_cast<std::uint8_t>(i));
    completeTransitions();
}

void PhraseMatcher::addPhrase(std::string_view phrase, std::uint8_t index)
{
    if (phrase.empty())
        return;
    std::size_t state = 0;
    for (const char c : phrase) {
        const std::size_t byteClass = classOf_[static_cast<unsigned char>(c)];
        if (next(state, byteClass) == 0) {
            next(state, byteClass) = static_cast<State>(found_.size());
            found_.push_back(noPhrase);
            next_.resize(next_.size() + classes_, 0);
        }
        state = next(state, byteClass);
    }
    found_[state] = std::min(found_[state], index);
}

// Breadth first: a state's missing transitions are those of its longest proper suffix.
void PhraseMatcher::completeTransitions()
{
    std::vector<State> suffix(found_.size(), 0);
    std::deque<State> queue;
    for (std::size_t c = 0; c < classes_; ++c)
        if (next(0, c) != 0)
            queue.push_back(next(0, c));
    for (; !queue.empty(); queue.pop_front()) {
        const State state = queue.front();
        found_[state] = std::min(found_[state], found_[suffix[state]]);
        for (std::size_t c = 0; c < classes_; ++c) {
            const State onward = next(suffix[state], c);
            if (State& target = next(state, c); target == 0) {
                target = onward;
            } else {
                suffix[target] = onward;
                queue.push_back(target);
            }
        }
    }
}

std::size_t PhraseMatcher::firstIn(std::string_view line) const noexcept
{
    std::string folded;
    if (hasWideLetters_ && hasLeadOfTwo(line)) {
        folded = foldedCase(line);
        line = folded;
    }
    const State* const transitions = next_.data();
    std::size_t state = 0;
    std::uint8_t first = noPhrase;
    for (const char c : line) {
        state = transitions[state * classes_ + classOf_[static_cast<unsigned char>(c)]];
        first = std::min(first, found_[state]);
    }
    return first == noPhrase ? none : first;
}

}  // namespace contract
