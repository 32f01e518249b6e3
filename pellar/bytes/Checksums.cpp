// SPDX-License-Identifier: Apache-2.0
#include "pellar/bytes/Checksums.h"

#include <array>

namespace pellar {
namespace {

constexpr std::array<std::uint32_t, 256> makeTable()
{
    std::array<std::uint32_t, 256> table{};
    for (std::uint32_t byte = 0; byte < table.size(); ++byte) {
        std::uint32_t sum = byte;
        for (int bit = 0; bit < 8; ++bit)
            sum = sum >> 1U ^ ((sum & 1U) != 0 ? 0xEDB88320U : 0U);
        table[byte] = sum;
    }
    return table;
}

constexpr auto table = makeTable();

}  // namespace

std::uint32_t crc32(ByteView bytes)
{
    std::uint32_t sum = ~0U;
    for (const std::uint8_t byte : bytes)
        sum = table[(sum ^ byte) & 0xFFU] ^ sum >> 8U;
    return ~sum;
}

}  // namespace pellar
