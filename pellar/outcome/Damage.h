// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string_view>
#include <vector>

namespace pellar {

/// Kinds of damage, by what they mean to the owner of the files; a set of them.
class Damage {
public:
    enum Kind : std::uint8_t {
        Bookkeeping = 1,   ///< counts and maps that follow from the rest
        LostPlaces = 2,    ///< files and directories that nothing names any more
        Contents = 4,      ///< files or directories with parts that make no sense
        SharedBlocks = 8,  ///< two files lay claim to one place on the disk
        Structure = 16,    ///< what the file system itself is built on
        Unfinished = 32,  ///< it was in use to the last, and it is not known what was being written
        Unsurveyed = 64,  ///< the check gave up, so there may be much more
    };

    constexpr Damage() = default;
    constexpr Damage(Kind kind) : kinds_(kind) {}

    constexpr bool has(Kind kind) const { return (kinds_ & kind) != 0; }
    constexpr bool isNothing() const { return kinds_ == 0; }
    constexpr bool isOnly(Kind kind) const { return kinds_ == kind; }
    constexpr void add(Damage other) { kinds_ = static_cast<std::uint8_t>(kinds_ | other.kinds_); }

    friend constexpr bool operator==(Damage, Damage) = default;

private:
    std::uint8_t kinds_ = 0;
};

/// What damage means to the owner of the files, gravest first: English texts, and text keys.
/// They speak of a repair only where there is one.
std::vector<std::string_view> meaningOf(Damage damage, bool canBeRepaired = true);

}  // namespace pellar
