// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/commands/LocalTime.h"

#include <array>
#include <ctime>

namespace orvane {

std::string localTime(std::chrono::system_clock::time_point time)
{
    const std::time_t seconds = std::chrono::system_clock::to_time_t(time);
    std::tm parts{};
    std::array<char, 32> text{};
    if (::localtime_r(&seconds, &parts) == nullptr)
        return {};
    return {text.data(), std::strftime(text.data(), text.size(), "%Y-%m-%d %H:%M", &parts)};
}

}  // namespace orvane
