// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/texts/Quantities.h"

#include <fmt/format.h>

#include <array>
#include <ctime>

namespace orvane {
namespace {

std::string formatted(std::chrono::system_clock::time_point time, const char* format)
{
    const std::time_t seconds = std::chrono::system_clock::to_time_t(time);
    std::tm parts{};
    std::array<char, 64> text{};
    if (::localtime_r(&seconds, &parts) == nullptr)
        return {};
    return {text.data(), std::strftime(text.data(), text.size(), format, &parts)};
}

}  // namespace

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

std::string localTime(std::chrono::system_clock::time_point time)
{
    return formatted(time, "%Y-%m-%d %H:%M");
}

std::string zonedTime(std::chrono::system_clock::time_point time)
{
    return formatted(time, "%Y-%m-%d %H:%M:%S %z (%Z)");
}

std::string durationText(std::chrono::system_clock::duration duration, const Translator& texts)
{
    const std::int64_t seconds = std::chrono::duration_cast<std::chrono::seconds>(duration).count();
    const auto number = [](std::int64_t value) {
        return std::to_string(value);
    };
    if (seconds < 1)
        return texts.text("less than a second");
    if (seconds < 60)
        return texts.sentence("%@ s", {number(seconds)});
    if (seconds < 3600)
        return texts.sentence("%@ min %@ s", {number(seconds / 60), number(seconds % 60)});
    return texts.sentence("%@ h %@ min", {number(seconds / 3600), number(seconds / 60 % 60)});
}

}  // namespace orvane
