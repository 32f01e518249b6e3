// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string_view>
#include <vector>

namespace pellar {

using Bytes = std::vector<std::uint8_t>;
using ByteView = std::span<const std::uint8_t>;

/// A stretch of a file, a device or a region of one, in bytes.
struct ByteRange {
    std::uint64_t offset = 0;
    std::uint64_t length = 0;

    constexpr std::uint64_t end() const { return offset + length; }
    friend bool operator==(const ByteRange&, const ByteRange&) = default;
};

/// All of `count` bytes at `place`, or none.
std::optional<Bytes> readDisk(int descriptor, std::uint64_t place, std::size_t count);

// All of the bytes, however many calls that takes; 0, or errno. A file that ends before them, or
// takes none of them, is EIO; a place that no file has is EFBIG.

[[nodiscard]] int readAll(int descriptor, std::uint64_t place, std::span<std::uint8_t> bytes);
[[nodiscard]] int writeAll(int descriptor, std::uint64_t place, ByteView bytes);

// The number of `length` bytes, 8 at most, that stands at `offset`. All of them must be there.

constexpr std::uint64_t littleEndian(ByteView bytes, std::size_t offset, std::size_t length)
{
    std::uint64_t value = 0;
    for (std::size_t i = length; i-- > 0;)
        value = value << 8U | bytes[offset + i];
    return value;
}

constexpr std::uint64_t bigEndian(ByteView bytes, std::size_t offset, std::size_t length)
{
    std::uint64_t value = 0;
    for (std::size_t i = 0; i < length; ++i)
        value = value << 8U | bytes[offset + i];
    return value;
}

constexpr void putLittleEndian(std::span<std::uint8_t> bytes, std::size_t offset,
                               std::size_t length, std::uint64_t value)
{
    for (std::size_t i = 0; i < length; ++i)
        bytes[offset + i] = static_cast<std::uint8_t>(value >> (8 * i));
}

/// The text's place must lie within `bytes`.
bool holdsText(ByteView bytes, std::size_t offset, std::string_view text);

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
