// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <ctime>
#include <string>
#include <string_view>

namespace orvane {

/// Adds `text` to `log`, line ends kept, with nothing in it that a terminal would obey when the
/// log is shown: other control characters and what is no UTF-8 become U+FFFD.
void appendLogText(std::string& log, std::string_view text);

/// The time of day as logs show it ("2024-05-06 07:08:09 "), local time. Costs little when asked
/// a million times in a second.
class LogClock {
public:
    [[nodiscard]] std::string_view now();

private:
    std::time_t second_ = -1;
    std::string text_;
};

}  // namespace orvane
