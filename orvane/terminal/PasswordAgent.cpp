// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/PasswordAgent.h"

#include "pellar/process/ChildProcess.h"
#include "pellar/process/FileDescriptor.h"

#include <fcntl.h>
#include <linux/close_range.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <string>

extern char** environ;

namespace orvane {

using pellar::FileDescriptor;
namespace {

constexpr const char* program = "/usr/bin/pkttyagent";
constexpr int readyDescriptor = 3;

bool hasTerminal()
{
    return static_cast<bool>(FileDescriptor(::open("/dev/tty", O_RDWR | O_NOCTTY | O_CLOEXEC)));
}

/// The desktop's own dialog goes first, where there is a desktop. Elsewhere polkit finds no agent
/// that calls itself the second choice.
bool isOnDesktop()
{
    return std::getenv("DISPLAY") != nullptr || std::getenv("WAYLAND_DISPLAY") != nullptr;
}

/// After a fork, so nothing that allocates (signal-safety(7)). It stays in our process group, or
/// it could not read from the terminal, and does not outlive us.
[[noreturn]] void becomeAgent(const std::array<char*, 7>& arguments, int ready, int nothing,
                              pid_t parent)
{
    ::prctl(PR_SET_PDEATHSIG, SIGTERM);
    pellar::resetSignals();
    for (const int stream : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO})
        ::dup2(nothing, stream);
    ::dup2(ready, readyDescriptor);
    ::syscall(SYS_close_range, readyDescriptor + 1, ~0U, CLOSE_RANGE_CLOEXEC);
    if (::getppid() == parent)
        ::execve(program, arguments.data(), environ);
    ::_exit(127);
}

/// Above the number that the program is given.
FileDescriptor outOfTheWay(const FileDescriptor& descriptor)
{
    return FileDescriptor(::fcntl(descriptor.get(), F_DUPFD_CLOEXEC, readyDescriptor + 1));
}

/// The program closes the descriptor when it is ready, and so does its end.
void waitUntilReady(int ready)
{
    constexpr int longest = 10000;  // milliseconds
    pollfd polled{ready, POLLIN, 0};
    while (::poll(&polled, 1, longest) < 0 && errno == EINTR) {
    }
}

}  // namespace

std::unique_ptr<PasswordAgent> PasswordAgent::start()
{
    auto pipe = pellar::makePipe();
    if (!pipe || !hasTerminal() || ::access(program, X_OK) != 0)
        return nullptr;
    FileDescriptor ready = outOfTheWay(pipe->writeEnd);
    pipe->writeEnd.reset();
    const FileDescriptor nothing =
        outOfTheWay(FileDescriptor(::open("/dev/null", O_RDWR | O_CLOEXEC)));
    const pid_t parent = ::getpid();
    std::array<std::string, 6> words{program,
                                     "--process",
                                     std::to_string(parent),
                                     "--notify-fd",
                                     std::to_string(readyDescriptor),
                                     "--fallback"};
    std::array<char*, 7> arguments{};
    for (std::size_t i = 0; i < (isOnDesktop() ? words.size() : words.size() - 1); ++i)
        arguments[i] = words[i].data();
    const pid_t id = ::fork();
    if (id == 0)
        becomeAgent(arguments, ready.get(), nothing.get(), parent);
    ready.reset();
    if (id < 0)
        return nullptr;
    std::unique_ptr<PasswordAgent> agent(new PasswordAgent(id));
    waitUntilReady(pipe->readEnd.get());
    return agent->isRunning() ? std::move(agent) : nullptr;
}

PasswordAgent::~PasswordAgent()
{
    if (!isRunning())
        return;
    ::kill(id_, SIGTERM);
    while (::waitpid(id_, nullptr, 0) < 0 && errno == EINTR) {
    }
}

bool PasswordAgent::isRunning()
{
    if (id_ > 0 && ::waitpid(id_, nullptr, WNOHANG) != 0)
        id_ = -1;
    return id_ > 0;
}

}  // namespace orvane
