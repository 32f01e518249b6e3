// SPDX-License-Identifier: Apache-2.0
#include "pellar/process/FileDescriptor.h"

#include <fcntl.h>
#include <unistd.h>

namespace pellar {

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

}  // namespace pellar
