// SPDX-License-Identifier: Apache-2.0
#include "pellar/mounts/MountKeeper.h"

#include "pellar/process/ForkedSignals.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <ctime>
#include <vector>

namespace pellar {
namespace {

constexpr int lifelineOfKeeper = 0;
constexpr char dismissal = '.';

// The child of a process with threads: only calls that are safe in a signal handler, and nothing
// that allocates (fork(2), signal-safety(7)). All signals stay blocked; SIGKILL cannot be.

bool isDismissed() noexcept
{
    char byte = 0;
    ssize_t count;
    do
        count = ::read(lifelineOfKeeper, &byte, 1);
    while (count < 0 && errno == EINTR);
    return count == 1 && byte == dismissal;
}

// The tool has the claim's descriptor, and the lock with it, for as long as it runs (flock(2)). One
// that opens the disk exclusively makes mounting EBUSY as well.
bool isFree(const MountCall& call) noexcept
{
    if (call.isBind)
        return true;
    const int disk = ::open(call.source.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC);
    const bool isLocked = disk >= 0 && ::flock(disk, LOCK_EX | LOCK_NB) != 0;
    if (disk >= 0)
        ::close(disk);
    return !isLocked;
}

void mountWhenFree(const MountCalls& calls, std::size_t index) noexcept
{
    constexpr int attempts = 24 * 60 * 60 * 5;
    constexpr timespec pause{0, 200'000'000};
    for (int attempt = 0; attempt < attempts && !isMounted(calls.points, index); ++attempt) {
        if (isFree(calls.calls[index]) && perform(calls, index) != EBUSY)
            return;
        ::nanosleep(&pause, nullptr);
    }
}

/// `kept` in ascending order.
void closeAllBut(const std::vector<int>& kept) noexcept
{
    unsigned first = lifelineOfKeeper + 1;
    for (const int descriptor : kept) {
        const auto next = static_cast<unsigned>(descriptor);
        if (next > first)
            ::syscall(SYS_close_range, first, next - 1, 0U);
        first = next + 1;
    }
    ::syscall(SYS_close_range, first, ~0U, 0U);
}

[[noreturn]] void keep(const MountCalls& calls, const std::vector<int>& kept, int lifeline) noexcept
{
    ::setsid();
    ::prctl(PR_SET_NAME, "pellar-keeper");
    if (::dup2(lifeline, lifelineOfKeeper) != lifelineOfKeeper || ::chdir("/") != 0)
        ::_exit(1);
    closeAllBut(kept);
    if (!isDismissed())
        for (std::size_t i = 0; i < calls.calls.size(); ++i)
            mountWhenFree(calls, i);
    ::_exit(0);
}

std::vector<int> descriptorsOf(const MountCalls& calls)
{
    std::vector<int> descriptors;
    for (const MountPoint& point : calls.points)
        if (point.holder)
            descriptors.push_back(point.holder.get());
    std::sort(descriptors.begin(), descriptors.end());
    return descriptors;
}

}  // namespace

std::variant<MountKeeper, int> MountKeeper::start(const MountCalls& calls)
{
    const std::vector<int> kept = descriptorsOf(calls);
    int ends[2];
    if (::socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends) != 0)
        return errno;
    FileDescriptor ours(ends[0]);
    const FileDescriptor theirs(ends[1]);
    const SignalsBlocked blocked;
    const pid_t id = ::fork();
    if (id == 0)
        keep(calls, kept, theirs.get());
    if (id < 0)
        return errno;
    return MountKeeper(id, std::move(ours));
}

MountKeeper::~MountKeeper()
{
    if (id_ == 0)
        return;
    ::send(lifeline_.get(), &dismissal, 1, MSG_NOSIGNAL);
    while (::waitpid(id_, nullptr, 0) < 0 && errno == EINTR) {
    }
}

}  // namespace pellar
