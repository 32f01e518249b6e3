// SPDX-License-Identifier: Apache-2.0
#include "orvane/privileges/HelperProcess.h"

#include <fcntl.h>
#include <spawn.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <string_view>

extern char** environ;

namespace orvane {
namespace {

/// With the standard signal handling, whatever ours is.
class SpawnAttributes {
public:
    SpawnAttributes()
    {
        ::posix_spawnattr_init(&attributes_);
        sigset_t signals;
        ::sigfillset(&signals);
        ::posix_spawnattr_setsigdefault(&attributes_, &signals);
        ::sigemptyset(&signals);
        ::posix_spawnattr_setsigmask(&attributes_, &signals);
        ::posix_spawnattr_setflags(&attributes_, POSIX_SPAWN_SETSIGDEF | POSIX_SPAWN_SETSIGMASK);
    }
    SpawnAttributes(const SpawnAttributes&) = delete;
    SpawnAttributes& operator=(const SpawnAttributes&) = delete;
    ~SpawnAttributes() { ::posix_spawnattr_destroy(&attributes_); }
    const posix_spawnattr_t* get() const { return &attributes_; }

private:
    posix_spawnattr_t attributes_{};
};

pid_t spawn(const std::vector<std::string>& command, int input, int output)
{
    std::vector<char*> arguments;
    for (const std::string& argument : command)
        arguments.push_back(const_cast<char*>(argument.c_str()));
    arguments.push_back(nullptr);
    posix_spawn_file_actions_t actions;
    ::posix_spawn_file_actions_init(&actions);
    ::posix_spawn_file_actions_adddup2(&actions, input, STDIN_FILENO);
    ::posix_spawn_file_actions_adddup2(&actions, output, STDOUT_FILENO);
    // What it says of itself is said by us, in the user's words. Passwords are asked for on the
    // terminal itself.
    ::posix_spawn_file_actions_addopen(&actions, STDERR_FILENO, "/dev/null", O_WRONLY, 0);
    const SpawnAttributes attributes;
    pid_t id = -1;
    if (::posix_spawn(&id, arguments[0], &actions, attributes.get(), arguments.data(), environ) !=
        0)
        id = -1;
    ::posix_spawn_file_actions_destroy(&actions);
    return id;
}

}  // namespace

std::optional<HelperProcess> HelperProcess::start(const std::vector<std::string>& command)
{
    // A socket for its input: writing to one that has gone is an error, and no signal.
    int input[2];
    int output[2];
    if (::socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, input) != 0)
        return std::nullopt;
    FileDescriptor ourInput(input[0]);
    const FileDescriptor theirInput(input[1]);
    if (::pipe2(output, O_CLOEXEC) != 0)
        return std::nullopt;
    FileDescriptor ourOutput(output[0]);
    const FileDescriptor theirOutput(output[1]);
    const pid_t id = spawn(command, theirInput.get(), theirOutput.get());
    if (id < 0)
        return std::nullopt;
    return HelperProcess(id, std::move(ourInput), std::move(ourOutput));
}

HelperProcess::HelperProcess(HelperProcess&& other) noexcept
    : id_(std::exchange(other.id_, -1)),
      input_(std::move(other.input_)),
      output_(std::move(other.output_))
{
}

HelperProcess::~HelperProcess()
{
    closeInput();
    static_cast<void>(reap());
}

void HelperProcess::tell(std::string_view line)
{
    const std::string text = std::string(line) + "\n";
    if (input_)
        ::send(input_.get(), text.data(), text.size(), MSG_NOSIGNAL | MSG_DONTWAIT);
}

std::optional<int> HelperProcess::reap()
{
    if (id_ < 0)
        return std::nullopt;
    int status = 0;
    pid_t waited;
    do
        waited = ::waitpid(id_, &status, 0);
    while (waited < 0 && errno == EINTR);
    id_ = -1;
    return waited > 0 && WIFEXITED(status) ? std::optional(WEXITSTATUS(status)) : std::nullopt;
}

}  // namespace orvane
