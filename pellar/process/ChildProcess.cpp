// SPDX-License-Identifier: Apache-2.0
#include "pellar/process/ChildProcess.h"

#include "pellar/process/ReducedRights.h"

#include <fcntl.h>
#include <linux/close_range.h>
#include <pthread.h>
#include <sys/prctl.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>

namespace pellar {
namespace {

/// Everything the child needs, made ready before the fork: after it only calls are allowed that
/// are safe in a signal handler (signal-safety(7)), and none of them allocates.
struct Preparation {
    FileDescriptor input;
    FileDescriptor output;
    FileDescriptor disk;
    FileDescriptor progress;
    FileDescriptor failure;
    std::vector<char*> arguments;
    std::string name;  ///< as a tool calls itself in its messages
    std::string executable;
    pid_t parent = 0;
    Access access = Access::ReadOnly;
    bool ignoresStops = false;
    bool isReduced = false;
    FileDescriptor writingRule;
};

/// Above the numbers that the child hands out, so no duplication overwrites another.
FileDescriptor duplicatedAbove(int descriptor)
{
    constexpr int firstFree = 10;
    return descriptor < 0 ? FileDescriptor()
                          : FileDescriptor(::fcntl(descriptor, F_DUPFD_CLOEXEC, firstFree));
}

Preparation prepare(const Command& command, const ChildStreams& streams, int failure)
{
    const FileDescriptor nothing(::open("/dev/null", O_RDONLY | O_CLOEXEC));
    Preparation ready;
    ready.input = duplicatedAbove(nothing.get());
    ready.output = duplicatedAbove(streams.output);
    ready.disk = duplicatedAbove(streams.disk);
    ready.progress = duplicatedAbove(streams.progress);
    ready.failure = duplicatedAbove(failure);
    ready.executable = command.executable.string();
    ready.name = command.executable.filename().string();
    ready.parent = ::getpid();
    ready.access = streams.access;
    ready.ignoresStops = streams.ignoresStops;
    ready.isReduced = command.isReduced;
    if (command.isReduced && !command.writable.empty())
        ready.writingRule = ruleForWritingBelow(command.writable);
    return ready;
}

/// Points into `ready` and `command`, so both stay where they are until the exec.
void pointArguments(Preparation& ready, const Command& command)
{
    // execve(2) takes pointers to non-constant text for history's sake and changes nothing.
    ready.arguments.push_back(ready.name.data());
    for (const std::string& argument : command.arguments)
        ready.arguments.push_back(const_cast<char*>(argument.c_str()));
    ready.arguments.push_back(nullptr);
}

bool isComplete(const Preparation& ready, const ChildStreams& streams)
{
    return ready.input && ready.output && ready.failure && (streams.disk < 0 || ready.disk) &&
           (streams.progress < 0 || ready.progress);
}

bool place(const FileDescriptor& source, int number)
{
    return !source || ::dup2(source.get(), number) == number;
}

[[noreturn]] void becomeTool(const Preparation& ready)
{
    static constexpr std::array environment{"PATH=/usr/sbin:/usr/bin:/sbin:/bin", "LC_ALL=C",
                                            "LANG=C", static_cast<const char*>(nullptr)};
    ::setpgid(0, 0);
    const bool writes = ready.access == Access::ReadWrite;
    ::prctl(PR_SET_PDEATHSIG, writes ? SIGTERM : SIGKILL);
    const bool isOrphan = ::getppid() != ready.parent;  // it died before the line above
    resetSignals();
    if (writes)
        ::signal(SIGPIPE, SIG_IGN);
    // What is ignored stays so across the exec (execve(2)).
    if (ready.ignoresStops) {
        ::signal(SIGINT, SIG_IGN);
        ::signal(SIGTERM, SIG_IGN);
    }
    const bool isPlaced = place(ready.input, STDIN_FILENO) && place(ready.output, STDOUT_FILENO) &&
                          place(ready.output, STDERR_FILENO) &&
                          place(ready.disk, diskDescriptorOfTool) &&
                          place(ready.progress, progressDescriptorOfTool);
    // Ours are all closed on exec; this is for those of other libraries in the process.
    const unsigned first = progressDescriptorOfTool + (ready.progress ? 1U : 0U);
    ::syscall(SYS_close_range, first, ~0U, CLOSE_RANGE_CLOEXEC);
    const bool hasItsRights =
        !ready.isReduced ||
        (reduceRights({}) && (!ready.writingRule || obeyRule(ready.writingRule.get())));
    if (!isOrphan && isPlaced && hasItsRights && ::chdir("/") == 0)
        ::execve(ready.executable.c_str(), ready.arguments.data(),
                 const_cast<char* const*>(environment.data()));
    const int error = errno;
    [[maybe_unused]] const auto written = ::write(ready.failure.get(), &error, sizeof error);
    ::_exit(127);
}

pid_t forkTool(const Preparation& ready)
{
    const SignalsBlocked blocked;
    const pid_t id = ::fork();
    if (id == 0)
        becomeTool(ready);
    return id;
}

/// 0 once the program runs; the write end closes with the exec.
int errorOfExec(int descriptor)
{
    int error = 0;
    ssize_t count;
    do
        count = ::read(descriptor, &error, sizeof error);
    while (count < 0 && errno == EINTR);
    return count == sizeof error ? error : 0;
}

}  // namespace

Result<ChildProcess, NotStarted> ChildProcess::start(const Command& command,
                                                     const ChildStreams& streams)
{
    int ends[2];
    if (::pipe2(ends, O_CLOEXEC) != 0)
        return NotStarted{errno};
    const FileDescriptor failure(ends[0]);
    FileDescriptor failureWriter(ends[1]);
    Preparation ready = prepare(command, streams, failureWriter.get());
    pointArguments(ready, command);
    if (!isComplete(ready, streams))
        return NotStarted{errno};
    const pid_t id = forkTool(ready);
    if (id < 0)
        return NotStarted{errno};
    ::setpgid(id, id);  // parent or child first: a signal to the group must find it
    ChildProcess child(id, FileDescriptor(static_cast<int>(::syscall(SYS_pidfd_open, id, 0))));
    const int pidfdError = child.end_ ? 0 : errno;
    failureWriter.reset();
    ready.failure.reset();
    const int error = pidfdError != 0 ? pidfdError : errorOfExec(failure.get());
    if (error != 0)
        return NotStarted{error};
    return child;
}

ChildProcess::ChildProcess(ChildProcess&& other) noexcept
    : id_(std::exchange(other.id_, 0)), end_(std::move(other.end_))
{
}

ChildProcess::~ChildProcess()
{
    if (id_ == 0)
        return;
    signalGroup(SIGKILL);
    reap();
}

void ChildProcess::signalGroup(int signal) noexcept
{
    if (id_ != 0)
        ::kill(-id_, signal);
}

Ending ChildProcess::reap() noexcept
{
    siginfo_t info = {};
    while (::waitid(P_PID, static_cast<id_t>(id_), &info, WEXITED | WNOWAIT) != 0 &&
           errno == EINTR) {
    }
    // While the ended process is not reaped its number cannot be another group's.
    signalGroup(SIGKILL);
    int status = 0;
    pid_t waited;
    do
        waited = ::waitpid(id_, &status, 0);
    while (waited < 0 && errno == EINTR);
    id_ = 0;
    if (waited < 0)
        return NotStarted{errno};  // it was reaped elsewhere: there is no status to trust
    if (WIFSIGNALED(status))
        return Killed{WTERMSIG(status)};
    return Exited{WEXITSTATUS(status)};
}

}  // namespace pellar
