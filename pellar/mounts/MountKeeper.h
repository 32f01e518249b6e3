// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/mounts/MountCall.h"
#include "pellar/process/FileDescriptor.h"

#include <sys/types.h>

#include <utility>
#include <variant>

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
    [[nodiscard]] static std::variant<MountKeeper, int> start(const MountCalls& calls);

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

}  // namespace pellar
