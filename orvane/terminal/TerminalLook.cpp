// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/TerminalLook.h"

#include <sys/ioctl.h>
#include <unistd.h>

#include <cstdlib>
#include <string_view>

namespace orvane {
namespace {

bool isTerminal()
{
    const char* const type = std::getenv("TERM");
    return ::isatty(STDOUT_FILENO) == 1 && type != nullptr && std::string_view(type) != "dumb";
}

/// NO_COLOR is the informal standard for "no colours, please".
bool wantsColors(const Request& request)
{
    if (request.coloring != Coloring::Auto)
        return request.coloring == Coloring::Always;
    const char* const noColor = std::getenv("NO_COLOR");
    return isTerminal() && (noColor == nullptr || *noColor == '\0');
}

}  // namespace

std::size_t terminalColumns()
{
    winsize size{};
    if (::ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) == 0 && size.ws_col > 1)
        return size.ws_col - 1U;
    return 79;
}

TerminalLook lookOf(const Request& request)
{
    return {isTerminal(), wantsColors(request), terminalColumns()};
}

}  // namespace orvane
