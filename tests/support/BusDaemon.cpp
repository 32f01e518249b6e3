// SPDX-License-Identifier: Apache-2.0
#include "tests/support/BusDaemon.h"

#include "pellar/process/FileDescriptor.h"

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

namespace orvane::test {
namespace {

constexpr const char* program = "/usr/bin/dbus-daemon";
constexpr int addressDescriptor = 3;

std::string configuration(const std::string& directory)
{
    return "<busconfig><type>session</type><listen>unix:dir=" + directory +
           "</listen><policy context=\"default\"><allow send_destination=\"*\" "
           "eavesdrop=\"true\"/><allow eavesdrop=\"true\"/><allow own=\"*\"/></policy>"
           "</busconfig>\n";
}

pid_t start(const std::string& file, int output)
{
    posix_spawn_file_actions_t actions;
    ::posix_spawn_file_actions_init(&actions);
    ::posix_spawn_file_actions_adddup2(&actions, output, addressDescriptor);
    // A daemon that outlives a test that crashed holds no pipe of who runs the tests.
    ::posix_spawn_file_actions_addopen(&actions, STDOUT_FILENO, "/dev/null", O_WRONLY, 0);
    // It complains when it may not raise its own limits.
    ::posix_spawn_file_actions_addopen(&actions, STDERR_FILENO, "/dev/null", O_WRONLY, 0);
    std::string name = program;
    std::string configures = "--config-file=" + file;
    std::string stays = "--nofork";
    std::string prints = "--print-address=" + std::to_string(addressDescriptor);
    char* words[] = {name.data(), configures.data(), stays.data(), prints.data(), nullptr};
    pid_t child = 0;
    const int error = ::posix_spawn(&child, program, &actions, nullptr, words, environ);
    ::posix_spawn_file_actions_destroy(&actions);
    return error == 0 ? child : 0;
}

std::string readLine(int descriptor)
{
    std::string line;
    pollfd polled{descriptor, POLLIN, 0};
    while (::poll(&polled, 1, 20'000) == 1) {
        char c = 0;
        if (::read(descriptor, &c, 1) != 1 || c == '\n')
            break;
        line += c;
    }
    return line;
}

}  // namespace

BusDaemon::BusDaemon()
{
    const std::string file = directory_ / "bus.conf";
    write(file, configuration(directory_.path));
    auto pipe = pellar::makePipe();
    daemon_ = pipe ? start(file, pipe->writeEnd.get()) : 0;
    if (daemon_ == 0)
        return;
    pipe->writeEnd.reset();
    address_ = readLine(pipe->readEnd.get());
}

BusDaemon::~BusDaemon()
{
    if (daemon_ == 0)
        return;
    ::kill(daemon_, SIGTERM);
    ::waitpid(daemon_, nullptr, 0);
}

}  // namespace orvane::test
