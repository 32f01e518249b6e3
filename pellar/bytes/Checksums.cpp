// SPDX-License-Identifier: Apache-2.0
#include "pellar/bytes/Checksums.h"

#include <array>

namespace pellar {
namespace {

using Table = std::array<std::uint32_t, 256>;

/// Of the reflected polynomial.
constexpr Table tableOf(std::uint32_t polynomial)
{
    Table table{};
    for (std::uint32_t byte = 0; byte < table.size(); ++byte) {
        std::uint32_t sum = byte;
        for (int bit = 0; bit < 8; ++bit)
            sum = sum >> 1U ^ ((sum & 1U) != 0 ? polynomial : 0U);
        table[byte] = sum;
    }
    return table;
}

std::uint32_t remainder(ByteView bytes, const Table& table)
{
    std::uint32_t sum = ~0U;
    for (const std::uint8_t byte : bytes)
        sum = table[(sum ^ byte) & 0xFFU] ^ sum >> 8U;
    return sum;
}

}  // namespace

std::uint32_t crc32(ByteView bytes)
{
    static constexpr Table table = tableOf(0xEDB88320);
    return ~remainder(bytes, table);
}

std::uint32_t crc32c(ByteView bytes)
{
    static constexpr Table table = tableOf(0x82F63B78);
    return remainder(bytes, table);
}

}  // namespace pellar
