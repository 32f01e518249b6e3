// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/ProgressLine.h"

#include "contract/foundation/UTF8.h"
#include "orvane/terminal/TerminalText.h"

#include <fmt/format.h>

#include <algorithm>

namespace orvane {
namespace {

constexpr int barCells = 24;

std::string repeated(std::string_view cell, int times)
{
    std::string text;
    for (int i = 0; i < times; ++i)
        text += cell;
    return text;
}

std::string bar(double percent)
{
    const int full = std::clamp(static_cast<int>(percent / 100 * barCells), 0, barCells);
    return repeated("█", full) + repeated("░", barCells - full) +
           fmt::format(" {:3.0f} %", std::clamp(percent, 0.0, 100.0));
}

/// A mark that wanders once over the bar in as many seconds as it has cells.
std::string wanderingMark(std::chrono::seconds elapsed)
{
    const int at = static_cast<int>(elapsed.count() % barCells);
    return repeated("░", at) + "█" + repeated("░", barCells - at - 1) +
           fmt::format(" {}:{:02}", elapsed.count() / 60, elapsed.count() % 60);
}

}  // namespace

std::string progressLine(const JobProgress& progress, std::size_t columns)
{
    const std::string gauge =
        progress.percent ? bar(*progress.percent) : wanderingMark(progress.elapsed);
    return fittedTo(gauge + "  " + contract::printable(progress.status), columns);
}

}  // namespace orvane
