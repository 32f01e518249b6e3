// SPDX-License-Identifier: Apache-2.0
#include "tests/support/BusDaemon.h"

#include "pellar/process/FileDescriptor.h"

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

namespace orvane::test {

BusDaemon::BusDaemon()
{
    const std::string file = directory_ / "bus.conf";
    write(file, "<busconfig><type>session</type><listen>unix:dir=" + directory_.path().native() +
                    "</listen><policy context=\"default\"><allow send_destination=\"*\" "
                    "eavesdrop=\"true\"/><allow eavesdrop=\"true\"/><allow own=\"*\"/></policy>"
                    "</busconfig>\n");
    const std::string configuration = "--config-file=" + file;
    auto pipe = pellar::makePipe().value();
    daemon_ = ::fork();
    if (daemon_ == 0) {
        ::dup2(pipe.writeEnd.get(), STDOUT_FILENO);
        // It complains when it may not raise its own limits.
        ::dup2(::open("/dev/null", O_WRONLY | O_CLOEXEC), STDERR_FILENO);
        ::execl("/usr/bin/dbus-daemon", "dbus-daemon", configuration.c_str(), "--nofork",
                "--print-address=1", nullptr);
        ::_exit(127);
    }
    pipe.writeEnd.reset();
    pollfd polled{pipe.readEnd.get(), POLLIN, 0};
    for (char c = 0;
         ::poll(&polled, 1, 20'000) == 1 && ::read(pipe.readEnd.get(), &c, 1) == 1 && c != '\n';)
        address_ += c;
}

BusDaemon::~BusDaemon()
{
    if (daemon_ > 0) {
        ::kill(daemon_, SIGTERM);
        ::waitpid(daemon_, nullptr, 0);
    }
}

}  // namespace orvane::test
