// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/ProgramStart.h"

#include <fcntl.h>
#include <pthread.h>
#include <sys/resource.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <string_view>

namespace orvane {
namespace {

constexpr int exitWithoutRoom = 8;  // could not be checked (fsck(8))

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

// A write beyond the limit (ulimit -f) would end the program without a word; ignored, it fails with
// EFBIG, and who writes says so. What the program starts has the standard handling again.
void surviveFileSizeLimit()
{
    std::signal(SIGXFSZ, SIG_IGN);
}

// A main thread grows up to the limit of the moment; other threads are made as large as the limit
// was when the program began (pthread_create(3)).
void giveStacksRoom()
{
    constexpr rlim_t usual = 8U << 20U;
    constexpr rlim_t least = 512U << 10U;
    rlimit limit = {};
    if (::getrlimit(RLIMIT_STACK, &limit) == 0 && limit.rlim_cur < usual) {
        // Root may raise the upper limit as well.
        const rlimit wanted{usual, std::max(usual, limit.rlim_max)};
        limit.rlim_cur = std::min(usual, limit.rlim_max);
        if (::setrlimit(RLIMIT_STACK, &wanted) == 0)
            limit = wanted;
        else
            ::setrlimit(RLIMIT_STACK, &limit);
        if (limit.rlim_cur < least) {
            constexpr std::string_view sentence =
                "Orvane cannot work with a stack of less than 512 KiB; see “ulimit -s”.\n";
            static_cast<void>(!::write(STDERR_FILENO, sentence.data(), sentence.size()));
            ::_exit(exitWithoutRoom);
        }
    }
    pthread_attr_t threads;
    std::size_t size = 0;
    if (::pthread_getattr_default_np(&threads) != 0)
        return;
    if (::pthread_attr_getstacksize(&threads, &size) == 0 && size < usual &&
        ::pthread_attr_setstacksize(&threads, usual) == 0)
        ::pthread_setattr_default_np(&threads);
    ::pthread_attr_destroy(&threads);
}

}  // namespace

void setInheritanceRight()
{
    keepStandardStreamsTaken();
    hearOfChildren();
    surviveFileSizeLimit();
    giveStacksRoom();
}

std::string_view programVersion()
{
    return ORVANE_VERSION;
}

}  // namespace orvane
