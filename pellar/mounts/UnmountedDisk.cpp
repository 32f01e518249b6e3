// SPDX-License-Identifier: Apache-2.0
#include "pellar/mounts/UnmountedDisk.h"

#include "contract/foundation/UTF8.h"
#include "pellar/mounts/Holders.h"
#include "pellar/process/ChildProcess.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <csignal>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <memory>
#include <thread>
#include <utility>
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

int unmountPatiently(const MountCalls& calls, std::size_t index)
{
    // A file manager or an indexer that has just looked is gone in a moment.
    constexpr int attempts = 4;
    int error = 0;
    for (int attempt = 0; attempt < attempts; ++attempt) {
        if (attempt > 0)
            std::this_thread::sleep_for(std::chrono::milliseconds(150));
        error = unmount(calls.points, index);
        if (error != EBUSY)
            break;
    }
    return error;
}

/// Where something else is mounted below the directory.
std::vector<std::string> mountsBelow(const std::string& directory, const SystemPaths& paths)
{
    std::vector<std::string> targets;
    for (const Mount& mount : currentMounts(paths))
        if (mount.target.starts_with(directory + '/'))
            targets.push_back(mount.target);
    return targets;
}

Sentence refusal(const Mount& place, int error, const SystemPaths& paths)
{
    const std::string target = contract::printable(place.target);
    if (error == EPERM || error == EACCES)
        return {"it is mounted at “%1$@”, and only an administrator may unmount it", target, {}};
    if (error != EBUSY)
        return {"it cannot be unmounted from “%1$@”: %2$@", target, ::strerrordesc_np(error)};
    if (const auto below = mountsBelow(place.target, paths); !below.empty())
        return {"it is mounted at “%1$@”, and something else below, at %2$@", target,
                shownNames(below)};
    if (const auto holders = holdersOf(place.target); !holders.empty())
        return {"it is mounted at “%1$@” and in use by %2$@", target, shownNames(holders)};
    return {"it is mounted at “%1$@” and in use", target, {}};
}

/// Why it could not be unmounted, or mounted again as it is; nothing when it could.
Sentence objectionTo(const std::vector<Mount>& places)
{
    const bool isWhole = !std::all_of(places.begin(), places.end(),
                                      [](const Mount& place) { return place.isBind(); });
    for (const Mount& place : places)
        if (place.filesystem.starts_with("fuse") || !isWhole)
            return {"it is mounted at “%1$@” in a way that could not be put back (%2$@)",
                    contract::printable(place.target), contract::printable(place.filesystem)};
    return {};
}

Sentence whyNotHeld(const Mount& place, int error, const SystemPaths& paths)
{
    const std::string target = contract::printable(place.target);
    if (error == EBUSY)
        return {"it is mounted at “%1$@”, and something else over it", target, {}};
    if (error == EPERM || error == EACCES)
        return refusal(place, error, paths);
    return {"it is mounted at “%1$@” in a way that could not be put back (%2$@)", target,
            ::strerrordesc_np(error)};
}

Sentence whyNotMountedAgain(const MountCall& call, int error)
{
    const std::string target = contract::printable(call.target);
    if (error == ESTALE)
        return {"It stays unmounted: “%1$@” is no longer the directory at which it was mounted.",
                target,
                {}};
    return {"It could not be mounted again at “%1$@”: %2$@.", target, ::strerrordesc_np(error)};
}

}  // namespace

Result<MountKeeper, int> MountKeeper::start(const MountCalls& calls)
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

Result<UnmountedDisk, Sentence> UnmountedDisk::take(std::vector<Mount> places,
                                                    const SystemPaths& paths)
{
    if (const Sentence objection = objectionTo(places); !objection.isEmpty())
        return objection;
    auto calls = mountCallsFor(places);
    if (!calls)
        return whyNotHeld(places[calls.error().place], calls.error().error, paths);
    auto keeper = MountKeeper::start(*calls);
    if (!keeper)
        return Sentence{
            "nobody could be found to mount it again, should this program be killed: "
            "%1$@",
            ::strerrordesc_np(keeper.error()),
            {}};
    UnmountedDisk disk(*std::move(calls), *std::move(keeper));
    // The last one first: it may lie over or below the others.
    for (; disk.mounted_ > 0; --disk.mounted_) {
        const std::size_t last = disk.mounted_ - 1;
        if (const int error = unmountPatiently(disk.calls_, last))
            return refusal(places[last], error, paths);
        if (disk.calls_.points[last].holder)
            disk.uncovered_.push_back(openShown(disk.calls_.points, last));
    }
    return disk;
}

std::vector<Sentence> UnmountedDisk::mountAgain()
{
    std::vector<Sentence> failures;
    for (; mounted_ < calls_.calls.size(); ++mounted_)
        if (const int error = perform(calls_, mounted_))
            failures.push_back(whyNotMountedAgain(calls_.calls[mounted_], error));
    uncovered_.clear();
    keeper_.reset();
    return failures;
}

}  // namespace pellar
