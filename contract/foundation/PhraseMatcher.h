// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace contract {

/// Finds which of a few phrases occurs in a line, whatever the case of the letters, in one pass
/// over the line's bytes and without allocating.
///
/// Case is ignored for the letters of ASCII, Latin-1, Latin Extended-A, modern and Coptic Greek,
/// and Cyrillic (U+0400 to U+04FF) in UTF-8; other characters, and bytes that are no UTF-8, match
/// themselves alone. An empty phrase never occurs.
///
/// It is an automaton after Aho and Corasick ("Efficient string matching: an aid to
/// bibliographic search", 1975) over classes of bytes.
class PhraseMatcher {
public:
    static constexpr std::size_t none = static_cast<std::size_t>(-1);

    /// At most 254 phrases.
    explicit PhraseMatcher(std::span<const std::string> phrases);

    /// The index of the first phrase, in the order given, that occurs anywhere in `line`.
    std::size_t firstIn(std::string_view line) const noexcept;

private:
    using State = std::uint16_t;
    static constexpr std::uint8_t noPhrase = 255;

    void addPhrase(std::string_view phrase, std::uint8_t index);
    void completeTransitions();
    State& next(std::size_t state, std::size_t byteClass)
    {
        return next_[state * classes_ + byteClass];
    }

    std::array<std::uint8_t, 256> classOf_{};
    std::size_t classes_ = 1;          ///< class 0: every byte that no phrase holds
    std::vector<State> next_;          ///< by state and class
    std::vector<std::uint8_t> found_;  ///< by state: the first phrase that ends there
    bool hasWideLetters_ = false;      ///< then lines are folded before they are matched
};

/// `text` with the letters of the scripts above in lower case; the same length in bytes.
std::string foldedCase(std::string_view text);

}  // namespace contract
