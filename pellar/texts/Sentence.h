// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Format.h"
#include "pellar/texts/Texts.h"

#include <charconv>
#include <cstdint>
#include <string>
#include <string_view>
#include <utility>

namespace pellar {

/// A text that is still to be put into the user's language: the English format and what fills
/// its "%1$@" and "%2$@". Pure functions answer these. The key is a literal, and so is `keyForOne`:
/// the format for when `first` is the number 1, where that needs another.
struct Sentence {
    std::string_view key;
    std::string first;
    std::string second;
    std::string_view keyForOne = {};

    bool isEmpty() const { return key.empty(); }
    std::string in(const Texts& texts) const
    {
        return isEmpty() ? std::string() : contract::format(formatIn(texts), {first, second});
    }

    friend bool operator==(const Sentence&, const Sentence&) = default;

private:
    std::string formatIn(const Texts& texts) const
    {
        std::uint64_t count = 0;
        std::from_chars(first.data(), first.data() + first.size(), count);
        return keyForOne.empty() ? texts.text(key) : texts.pluralText(keyForOne, key, count);
    }
};

/// A sentence about a number of things.
inline Sentence sentenceAbout(std::uint64_t count, std::string_view keyForOne,
                              std::string_view keyForMany, std::string second = {})
{
    return {keyForMany, std::to_string(count), std::move(second), keyForOne};
}

}  // namespace pellar
