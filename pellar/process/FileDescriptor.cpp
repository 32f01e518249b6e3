// SPDX-License-Identifier: Apache-2.0
#include "pellar/process/FileDescriptor.h"

#include <fcntl.h>
#include <stdlib.h>
#include <sys/ioctl.h>
#include <termios.h>
#include <unistd.h>

namespace pellar {
namespace {

/// Not by the path of the other side: in a container /dev/pts may be another one's.
FileDescriptor otherSideOf(int terminal)
{
    return FileDescriptor(::ioctl(terminal, TIOCGPTPEER, O_RDWR | O_NOCTTY | O_CLOEXEC));
}

bool makeRaw(int terminal)
{
    termios settings = {};
    if (::tcgetattr(terminal, &settings) != 0)
        return false;
    ::cfmakeraw(&settings);
    return ::tcsetattr(terminal, TCSANOW, &settings) == 0;
}

bool makeWide(int terminal)
{
    const winsize size{24, 1000, 0, 0};
    return ::ioctl(terminal, TIOCSWINSZ, &size) == 0;
}

}  // namespace

void FileDescriptor::reset() noexcept
{
    if (descriptor_ >= 0)
        ::close(std::exchange(descriptor_, -1));
}

std::string pathOfDescriptor(int descriptor)
{
    return "/proc/self/fd/" + std::to_string(descriptor);
}

std::optional<Pipe> makePipe()
{
    int ends[2];
    if (::pipe2(ends, O_CLOEXEC) != 0)
        return std::nullopt;
    Pipe pipe{FileDescriptor(ends[0]), FileDescriptor(ends[1])};
    if (::fcntl(pipe.readEnd.get(), F_SETFL, O_NONBLOCK) != 0)
        return std::nullopt;
    return pipe;
}

std::optional<Pipe> makePseudoTerminal()
{
    FileDescriptor ours(::posix_openpt(O_RDWR | O_NOCTTY | O_CLOEXEC | O_NONBLOCK));
    if (!ours || ::unlockpt(ours.get()) != 0)
        return std::nullopt;
    FileDescriptor theirs = otherSideOf(ours.get());
    if (!theirs || !makeRaw(theirs.get()) || !makeWide(theirs.get()))
        return std::nullopt;
    return Pipe{std::move(ours), std::move(theirs)};
}

}  // namespace pellar
