// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <string_view>
#include <vector>

namespace pellar {

/// Keeps the brief log readable on a disk with ten thousand problems: of each kind only the first
/// few are shown as errors, the others are counted. Problems are of one kind when they differ in
/// numbers and quoted names only.
class ProblemLimiter {
public:
    static constexpr std::uint64_t shownOfKind = 10;
    static constexpr std::uint64_t shownInAll = 100;

    struct Remainder {
        std::uint64_t count;
        std::string kind;  ///< empty: of various kinds
    };

    /// Whether this problem is to be shown; counts it otherwise.
    bool admits(std::string_view problem);
    /// What was not shown, by kind, and starts anew. A kind of which nothing was shown is
    /// counted with the various.
    std::vector<Remainder> takeRemainders();

private:
    struct Count {
        std::uint64_t shown = 0;
        std::uint64_t hidden = 0;
    };

    std::map<std::string, Count> kinds_;  ///< at most shownInAll: only kinds that were shown
    std::uint64_t shown_ = 0;
    std::uint64_t hiddenOfVariousKinds_ = 0;
};

/// "Inode 16 ref count is 9, should be 1.  Fix? no" → "Inode # ref count is #, should be #."
std::string kindOfProblem(std::string_view problem);

}  // namespace pellar
