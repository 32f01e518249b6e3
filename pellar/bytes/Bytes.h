// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string_view>
#include <vector>

namespace pellar {

using Bytes = std::span<const std::uint8_t>;

/// All of `count` bytes at `place`, or none.
std::optional<std::vector<std::uint8_t>> readDisk(int descriptor, std::uint64_t place,
                                                  std::size_t count);

// `offset` and `length` lie within `bytes`; `length` is 8 at most.
std::uint64_t littleEndian(Bytes bytes, std::size_t offset, std::size_t length);
std::uint64_t bigEndian(Bytes bytes, std::size_t offset, std::size_t length);

bool holdsText(Bytes bytes, std::size_t offset, std::string_view text);

constexpr bool isPowerOfTwo(std::uint64_t value)
{
    return value != 0 && (value & (value - 1)) == 0;
}

/// The greatest number when the product does not fit.
constexpr std::uint64_t productOrGreatest(std::uint64_t a, std::uint64_t b)
{
    return b != 0 && a > ~std::uint64_t{0} / b ? ~std::uint64_t{0} : a * b;
}

}  // namespace pellar
