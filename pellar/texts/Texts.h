// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace pellar {

/// The user's language. The host implements it over its string tables; any thread may ask, and
/// the object outlives every manager made with it. A table without the key answers the key.
class Texts {
public:
    virtual ~Texts() = default;

    /// From the table "Pellar".
    virtual std::string text(std::string_view englishKey) const = 0;
    /// The same of a text that depends on a number.
    virtual std::string pluralText(std::string_view englishOne, std::string_view englishMany,
                                   std::uint64_t count) const
    {
        return text(count == 1 ? englishOne : englishMany);
    }
    /// From the table "LocalizableFsck", where the module looks up the same phrases.
    virtual std::string resultText(std::string_view englishKey) const = 0;
};

}  // namespace pellar
