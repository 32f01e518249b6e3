// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/Reporter.h"

#include <cerrno>
#include <cstdio>

namespace orvane {

// A reader that has gone away has seen what it wanted; any other loss is said once, at the end.
void Reporter::flush()
{
    if (std::fflush(stdout) != 0 && errno != EPIPE)
        hasLostOutput_ = true;
}

bool Reporter::end()
{
    flush();
    if (hasLostOutput_)
        std::fputs("fixwell: not all of the output could be written\n", stderr);
    return !hasLostOutput_;
}

}  // namespace orvane
