// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <vector>

namespace pellar {

using Bytes = std::vector<std::uint8_t>;
using ByteView = std::span<const std::uint8_t>;

/// The number of `length` bytes (at most 8) that stands at `offset`, least significant byte first.
/// All of them must be there.
constexpr std::uint64_t littleEndian(ByteView bytes, std::size_t offset, std::size_t length)
{
    std::uint64_t value = 0;
    for (std::size_t i = length; i-- > 0;)
        value = value << 8U | bytes[offset + i];
    return value;
}

constexpr void putLittleEndian(std::span<std::uint8_t> bytes, std::size_t offset,
                               std::size_t length, std::uint64_t value)
{
    for (std::size_t i = 0; i < length; ++i)
        bytes[offset + i] = static_cast<std::uint8_t>(value >> (8 * i));
}

}  // namespace pellar
