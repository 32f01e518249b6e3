// SPDX-License-Identifier: Apache-2.0
#include "tests/terminal/Program.h"

#include "pellar/process/FileDescriptor.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <pty.h>
#include <sys/resource.h>
#include <sys/syscall.h>
#include <sys/wait.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <csignal>
#include <fstream>
#include <stdexcept>

namespace orvane::test {
namespace {

/// In the child; the test has no threads, so it may allocate there.
[[noreturn]] void execute(Launch launch)
{
    std::vector<std::string> settings;
    for (const auto& [name, value] : launch.environment)
        settings.push_back(name + "=" + value);
    launch.arguments.insert(launch.arguments.begin(), "fixwell");
    const auto pointersTo = [](std::vector<std::string>& texts) {
        std::vector<char*> pointers;
        for (std::string& text : texts)
            pointers.push_back(text.data());
        pointers.push_back(nullptr);
        return pointers;
    };
    const bool isAllowed =
        !launch.user || ::setresuid(*launch.user, *launch.user, *launch.user) == 0;
    if (isAllowed && (launch.directory.empty() || ::chdir(launch.directory.c_str()) == 0))
        ::execve(TERMINAL_PROGRAM, pointersTo(launch.arguments).data(),
                 pointersTo(settings).data());
    ::_exit(127);
}

}  // namespace

Program::Program(const Launch& launch) : deadline_(Clock::now() + launch.limit)
{
    if (launch.columns)
        startOnTerminal(launch);
    else
        startInPipes(launch);
    if (id_ < 0)
        throw std::runtime_error("cannot start the program");
    end_ = FileDescriptor(static_cast<int>(::syscall(SYS_pidfd_open, id_, 0)));
    for (const FileDescriptor* descriptor : {&output_, &errors_})
        if (*descriptor)
            ::fcntl(descriptor->get(), F_SETFL, O_NONBLOCK);
}

Program::~Program()
{
    if (id_ == 0)
        return;
    ::kill(id_, SIGKILL);
    reap();
}

void Program::startInPipes(const Launch& launch)
{
    auto output = pellar::makePipe();
    auto errors = pellar::makePipe();
    if (!output || !errors)
        throw std::runtime_error("cannot make a pipe for the test");
    id_ = ::fork();
    if (id_ == 0) {
        ::dup2(::open("/dev/null", O_RDONLY | O_CLOEXEC), STDIN_FILENO);
        ::dup2(launch.output == Launch::Output::Full ? ::open("/dev/full", O_WRONLY | O_CLOEXEC)
                                                     : output->writeEnd.get(),
               STDOUT_FILENO);
        if (launch.output == Launch::Output::Closed)
            ::close(STDOUT_FILENO);
        ::dup2(errors->writeEnd.get(), STDERR_FILENO);
        execute(launch);
    }
    output_ = std::move(output->readEnd);
    errors_ = std::move(errors->readEnd);
}

void Program::startOnTerminal(const Launch& launch)
{
    winsize size{};
    size.ws_row = 24;
    size.ws_col = *launch.columns;
    int master = -1;
    id_ = ::forkpty(&master, nullptr, nullptr, &size);
    if (id_ == 0)
        execute(launch);
    ::fcntl(master, F_SETFD, FD_CLOEXEC);
    output_ = FileDescriptor(master);
}

bool Program::waitFor(std::string_view text, int times)
{
    std::size_t from = 0;
    while (times > 0) {
        const std::size_t found = result_.output.find(text, from);
        if (found == std::string::npos && !readMore())
            return false;
        if (found == std::string::npos)
            continue;
        from = found + text.size();
        --times;
    }
    return true;
}

void Program::type(std::string_view bytes)
{
    ASSERT_EQ(::write(output_.get(), bytes.data(), bytes.size()),
              static_cast<ssize_t>(bytes.size()));
}

void Program::signal(int number)
{
    ASSERT_EQ(::kill(id_, number), 0);
}

// "ShdPnd: 0000000000000000" in /proc/ID/status: none is pending (proc(5)).
void Program::waitUntilSignalsAreTaken() const
{
    const std::string path = "/proc/" + std::to_string(id_) + "/status";
    for (bool isTaken = false; !isTaken && Clock::now() < deadline_; ::usleep(1000)) {
        std::ifstream status(path);
        for (std::string line; std::getline(status, line);)
            if (line.starts_with("ShdPnd:"))
                isTaken = line.find_first_not_of("0\t ", 7) == std::string::npos;
    }
}

void Program::stopReading()
{
    output_.reset();
    errors_.reset();
}

const RunResult& Program::finish()
{
    while (readMore()) {
    }
    if (id_ != 0)
        reap();
    return result_;
}

/// NO when the program has ended and all that it wrote is read, or when it had to be killed.
bool Program::readMore()
{
    if (id_ == 0)
        return false;
    std::array<pollfd, 3> waits{
        {{output_.get(), POLLIN, 0}, {errors_.get(), POLLIN, 0}, {end_.get(), POLLIN, 0}}};
    const auto left =
        std::chrono::duration_cast<std::chrono::milliseconds>(deadline_ - Clock::now());
    const int count =
        ::poll(waits.data(), waits.size(), static_cast<int>(std::max(left.count(), 0L)));
    if (count <= 0 && errno != EINTR) {
        ADD_FAILURE() << "the program took too long and was killed; it had said:\n"
                      << result_.output.substr(0, 2000) << result_.errors.substr(0, 2000);
        ::kill(id_, SIGKILL);
        reap();
        return false;
    }
    take(output_, result_.output);
    take(errors_, result_.errors);
    if ((waits[2].revents & POLLIN) == 0)
        return true;
    reap();
    return false;
}

/// What is there now. A terminal answers EIO when nobody has its other side open any more.
void Program::take(FileDescriptor& from, std::string& into)
{
    std::array<char, 65536> room;
    while (from) {
        const ssize_t count = ::read(from.get(), room.data(), room.size());
        if (count > 0)
            into.append(room.data(), static_cast<std::size_t>(count));
        else if (count == 0 || (errno != EINTR && errno != EAGAIN))
            from.reset();
        else if (errno == EAGAIN)
            break;
    }
}

void Program::reap()
{
    int status = 0;
    rusage usage{};
    while (::wait4(id_, &status, 0, &usage) < 0 && errno == EINTR) {
    }
    id_ = 0;
    take(output_, result_.output);
    take(errors_, result_.errors);
    result_.status = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    result_.signal = WIFSIGNALED(status) ? WTERMSIG(status) : 0;
    result_.mostMemoryInKiB = usage.ru_maxrss;
}

}  // namespace orvane::test
