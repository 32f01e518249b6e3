// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/mounts/MountPoint.h"
#include "pellar/mounts/MountTable.h"
#include "pellar/outcome/Result.h"
#include "pellar/process/FileDescriptor.h"
#include "pellar/texts/Sentence.h"

#include <sys/types.h>

#include <optional>
#include <utility>
#include <vector>

namespace pellar {

/// Watches over a disk that is unmounted for a job: a small process of its own, which mounts the
/// disk again should this process end before it has done so itself, killed (SIGKILL) or crashed. A
/// tool that is still at work on the disk is waited for, for a day at most.
///
/// It outlives signals to this process and its group, keeps nothing open but the directories in
/// which the places are, and works in "/". What is killed together with it, as by a shutdown, stays
/// unmounted. Any thread.
class MountKeeper {
public:
    /// An errno value where the system gives no process.
    [[nodiscard]] static Result<MountKeeper, int> start(const MountCalls& calls);

    MountKeeper(MountKeeper&& other) noexcept
        : id_(std::exchange(other.id_, 0)), lifeline_(std::move(other.lifeline_))
    {
    }
    MountKeeper& operator=(MountKeeper&&) = delete;
    /// All is as it was: it is told to go, and waited for.
    ~MountKeeper();

private:
    MountKeeper(pid_t id, FileDescriptor lifeline) : id_(id), lifeline_(std::move(lifeline)) {}

    pid_t id_;
    FileDescriptor lifeline_;
};

/// A disk that was unmounted for a job, and is mounted again where and as it was: at the latest
/// when this object goes, however the job ends, and also when this process is killed. It stays
/// unmounted where others have changed the place. Any thread; unmounting writes back what
/// is still to be written, which may take long.
class UnmountedDisk {
public:
    /// Unmounts all the places, or none: why not, naming who holds it.
    [[nodiscard]] static Result<UnmountedDisk, Sentence> take(std::vector<Mount> places,
                                                              const SystemPaths& paths);
    UnmountedDisk(UnmountedDisk&&) noexcept = default;
    UnmountedDisk& operator=(UnmountedDisk&&) = delete;
    ~UnmountedDisk() { static_cast<void>(mountAgain()); }

    /// What could not be mounted again, and why; empty when all is as before. Done once.
    [[nodiscard]] std::vector<Sentence> mountAgain();

private:
    UnmountedDisk(MountCalls calls, MountKeeper keeper)
        : calls_(std::move(calls)), mounted_(calls_.calls.size()), keeper_(std::move(keeper))
    {
    }

    MountCalls calls_;
    std::size_t mounted_;  ///< so many of them still are, the first ones
    /// Keeps the directories' numbers from going to others.
    std::vector<FileDescriptor> uncovered_;
    std::optional<MountKeeper> keeper_;
};

}  // namespace pellar
