// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/host/foundation/Format.h"
#include "pellar/Texts.h"

#include <string>
#include <string_view>

namespace pellar {

/// A text that is still to be put into the user's language: the English format and what fills
/// its "%1$@" and "%2$@". Pure functions answer these. The key is a literal.
struct Sentence {
    std::string_view key;
    std::string first;
    std::string second;

    bool isEmpty() const { return key.empty(); }
    std::string in(const Texts& texts) const
    {
        return isEmpty() ? std::string() : fixwell::format(texts.text(key), {first, second});
    }

    friend bool operator==(const Sentence&, const Sentence&) = default;
};

}  // namespace pellar
