// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Result.h"
#include "pellar/process/Command.h"
#include "pellar/process/FileDescriptor.h"

#include <pthread.h>
#include <sys/types.h>

#include <csignal>

namespace pellar {

/// No handler of ours runs in a forked child, and none in this thread, while this lives.
class SignalsBlocked {
public:
    SignalsBlocked()
    {
        sigset_t all;
        ::sigfillset(&all);
        ::pthread_sigmask(SIG_SETMASK, &all, &before_);
    }
    SignalsBlocked(const SignalsBlocked&) = delete;
    SignalsBlocked& operator=(const SignalsBlocked&) = delete;
    ~SignalsBlocked() { ::pthread_sigmask(SIG_SETMASK, &before_, nullptr); }

private:
    sigset_t before_;
};

/// In a forked child, before its exec: nothing of ours is handled, ignored or blocked there. Safe
/// after a fork (signal-safety(7)).
inline void resetSignals()
{
    struct sigaction standard = {};
    standard.sa_handler = SIG_DFL;
    for (int signal = 1; signal < NSIG; ++signal)
        ::sigaction(signal, &standard, nullptr);
    sigset_t none;
    ::sigemptyset(&none);
    ::pthread_sigmask(SIG_SETMASK, &none, nullptr);
}

/// The numbers under which a tool finds what it inherits besides its standard descriptors.
inline constexpr int diskDescriptorOfTool = 3;
inline constexpr int progressDescriptorOfTool = 4;

/// Borrowed for the length of the start; -1 for none.
struct ChildStreams {
    int output = -1;    ///< standard output and standard error
    int disk = -1;      ///< becomes diskDescriptorOfTool
    int progress = -1;  ///< becomes progressDescriptorOfTool
    /// A program that writes to a disk is asked to end when the host dies, and may go on printing
    /// to no reader until it has come to a good place; any other is killed.
    Access access = Access::ReadOnly;
    /// Starts with SIGINT and SIGTERM ignored: nothing but SIGKILL ends it before its time.
    bool ignoresStops = false;
};

/// A running program, or one that has ended and was not reaped yet. Destroying it kills and
/// reaps, so no zombie stays behind.
///
/// The program runs in a process group of its own, reads /dev/null, has a fixed PATH, the C
/// locale and nothing else of our environment, and no other descriptor than those of
/// ChildStreams. It is signalled when the thread that started it ends (PR_SET_PDEATHSIG,
/// prctl(2)), so it does not outlive the host; that thread therefore stays until the program has
/// ended.
class ChildProcess {
public:
    [[nodiscard]] static Result<ChildProcess, NotStarted> start(const Command& command,
                                                                const ChildStreams& streams);

    ChildProcess(ChildProcess&& other) noexcept;
    ChildProcess& operator=(ChildProcess&&) = delete;
    ~ChildProcess();

    /// Readable once the program has ended (pidfd_open(2)).
    int endDescriptor() const noexcept { return end_.get(); }
    /// To the program and everything it started in its group.
    void signalGroup(int signal) noexcept;
    /// Waits for the end, kills what is left of the group, and gives the process back.
    Ending reap() noexcept;

private:
    ChildProcess(pid_t id, FileDescriptor end) noexcept : id_(id), end_(std::move(end)) {}

    pid_t id_;
    FileDescriptor end_;
};

}  // namespace pellar
