// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/terminal/CommandLine.h"

#include <cstddef>

namespace orvane {

/// What standard output is, and how it may be written to.
struct TerminalLook {
    bool isTerminal = false;  ///< one that can move its cursor
    bool colors = false;
    std::size_t columns = 79;  ///< that a line may fill
};

/// Before standard output becomes a pager's input.
TerminalLook lookOf(const Request& request);

/// The columns of the terminal, but for the last, where some terminals wrap; 79 of anything else.
std::size_t terminalColumns();

}  // namespace orvane
