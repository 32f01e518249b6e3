// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/ByteCount.h"

#include <fmt/format.h>

#include <array>

namespace orvane {

std::string byteCount(std::uint64_t bytes)
{
    constexpr std::array units{"B", "KiB", "MiB", "GiB", "TiB", "PiB", "EiB"};
    auto amount = static_cast<double>(bytes);
    std::size_t unit = 0;
    for (; amount >= 1000 && unit + 1 < units.size(); ++unit)
        amount /= 1024;
    const bool isRound = unit == 0 || amount >= 9.95 || amount == static_cast<int>(amount);
    return fmt::format("{:.{}f} {}", amount, isRound ? 0 : 1, units[unit]);
}

}  // namespace orvane
