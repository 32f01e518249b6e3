// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/log/LogText.h"

#include "contract/foundation/UTF8.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <cstring>

namespace orvane {
namespace {

bool isPlain(unsigned char c)
{
    return c >= 0x20 && c < 0x7F;
}

// Whether all of eight bytes lie in 0x20..0x7E: adding 0x60 to a byte below 0x80 sets its top bit
// exactly from 0x20 on, and adding 1 sets it for 0x7F alone.
bool isPlain(std::uint64_t eight)
{
    constexpr std::uint64_t tops = 0x8080808080808080U;
    constexpr std::uint64_t ones = 0x0101010101010101U;
    const std::uint64_t low = eight & ~tops;
    return (eight & tops) == 0 && ((low + 0x60 * ones) & tops) == tops &&
           ((low + ones) & tops) == 0;
}

bool isPlain(std::string_view text)
{
    for (; text.size() >= sizeof(std::uint64_t); text.remove_prefix(sizeof(std::uint64_t))) {
        std::uint64_t eight = 0;
        std::memcpy(&eight, text.data(), sizeof eight);
        if (!isPlain(eight))
            return false;
    }
    return std::all_of(text.begin(), text.end(),
                       [](char c) { return isPlain(static_cast<unsigned char>(c)); });
}

}  // namespace

void appendLogText(std::string& log, std::string_view text)
{
    while (!text.empty()) {
        const std::size_t length = std::min(text.find('\n'), text.size());
        const std::string_view line = text.substr(0, length);
        if (isPlain(line))
            log += line;
        else
            log += contract::printable(line);
        text.remove_prefix(length);
        if (!text.empty()) {
            log += '\n';
            text.remove_prefix(1);
        }
    }
}

std::string_view LogClock::now()
{
    std::timespec time = {};
    ::clock_gettime(CLOCK_REALTIME_COARSE, &time);
    if (time.tv_sec != second_) {
        second_ = time.tv_sec;
        std::tm local = {};
        ::localtime_r(&second_, &local);
        std::array<char, 32> text;
        text_.assign(text.data(),
                     std::strftime(text.data(), text.size(), "%Y-%m-%d %H:%M:%S ", &local));
    }
    return text_;
}

}  // namespace orvane
