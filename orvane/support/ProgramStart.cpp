// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/ProgramStart.h"

#include <fcntl.h>
#include <unistd.h>

#include <csignal>

namespace orvane {
namespace {

// A standard stream that was closed leaves its number to the next file that is opened, and what
// is printed would go there: into a disk, say. What takes the place cannot be written, and is at
// its end when it is read.
void keepStandardStreamsTaken()
{
    for (int number = STDIN_FILENO; number <= STDERR_FILENO; ++number)
        if (::fcntl(number, F_GETFD) < 0)
            static_cast<void>(::open("/dev/null", O_RDONLY));
}

// Ignored, it stays so across an exec, and the status of a child that ends is lost (waitpid(2),
// NOTES): every check would fail.
void hearOfChildren()
{
    std::signal(SIGCHLD, SIG_DFL);
}

}  // namespace

void setInheritanceRight()
{
    keepStandardStreamsTaken();
    hearOfChildren();
}

}  // namespace orvane
