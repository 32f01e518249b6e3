// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/Pager.h"

#include "pellar/process/ChildProcess.h"

#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <sstream>
#include <utility>

namespace orvane {
namespace {

using pellar::FileDescriptor;

constexpr std::array endingSignals{SIGINT, SIGHUP, SIGTERM, SIGQUIT};

// What a signal handler needs to know of the pager that runs; 0: none does.
volatile pid_t runningPager = 0;
int outputBefore = -1;
int errorsBefore = -1;

void waitForPager()
{
    while (::waitpid(runningPager, nullptr, 0) < 0 && errno == EINTR) {
    }
    runningPager = 0;
}

/// The pager sees the end of its input. What another thread still writes goes nowhere.
void waitAndEnd(int signal)
{
    const int nowhere = ::open("/dev/null", O_WRONLY | O_CLOEXEC);
    ::dup2(nowhere, STDOUT_FILENO);
    if (errorsBefore >= 0)
        ::dup2(nowhere, STDERR_FILENO);
    waitForPager();
    struct sigaction standard = {};
    standard.sa_handler = SIG_DFL;
    ::sigaction(signal, &standard, nullptr);
    ::raise(signal);
}

void handle(int signal, void (*handler)(int))
{
    struct sigaction action = {};
    action.sa_handler = handler;
    ::sigfillset(&action.sa_mask);
    ::sigdelset(&action.sa_mask, signal);
    ::sigaction(signal, &action, nullptr);
}

/// In the child. The options are less(1)'s: colours are shown, and what fits on a screen ends it.
[[noreturn]] void becomePager(std::vector<std::string>& words, int input, int failure)
{
    pellar::resetSignals();
    ::dup2(input, STDIN_FILENO);
    ::setenv("LESS", "FRX", 0);
    std::vector<char*> arguments;
    for (std::string& word : words)
        arguments.push_back(word.data());
    arguments.push_back(nullptr);
    ::execvp(arguments.front(), arguments.data());
    static_cast<void>(!::write(failure, "!", 1));
    ::_exit(127);
}

/// The pipe that tells of a failure is closed by the exec.
bool hasStarted(pid_t id, const FileDescriptor& failure)
{
    char mark = 0;
    ssize_t length = 0;
    do {
        length = ::read(failure.get(), &mark, 1);
    } while (length < 0 && errno == EINTR);
    if (length == 0)
        return true;
    while (::waitpid(id, nullptr, 0) < 0 && errno == EINTR) {
    }
    return false;
}

bool makeWaiting(const FileDescriptor& readEnd)
{
    return ::fcntl(readEnd.get(), F_SETFL, 0) == 0;
}

int takePlaceOf(int stream, int replacement)
{
    const int before = ::fcntl(stream, F_DUPFD_CLOEXEC, STDERR_FILENO + 1);
    ::dup2(replacement, stream);
    return before;
}

void giveBack(int stream, int& before)
{
    if (before < 0)
        return;
    ::dup2(before, stream);
    ::close(std::exchange(before, -1));
}

}  // namespace

std::vector<std::string> pagerCommand(const std::optional<std::string>& variable)
{
    std::istringstream text(variable.value_or("less -FRX"));
    std::vector<std::string> words;
    for (std::string word; text >> word;)
        words.push_back(word);
    if (words.size() == 1 && words.front() == "cat")
        words.clear();
    return words;
}

std::unique_ptr<Pager> Pager::start(std::vector<std::string> command)
{
    if (command.empty())
        return nullptr;
    auto pages = pellar::makePipe();
    auto failure = pellar::makePipe();
    if (!pages || !failure || !makeWaiting(pages->readEnd) || !makeWaiting(failure->readEnd))
        return nullptr;
    std::fflush(stdout);
    const pid_t id = ::fork();
    if (id == 0)
        becomePager(command, pages->readEnd.get(), failure->writeEnd.get());
    failure->writeEnd.reset();
    if (id < 0 || !hasStarted(id, failure->readEnd))
        return nullptr;
    return std::unique_ptr<Pager>(new Pager(id, std::move(pages->writeEnd)));
}

Pager::Pager(pid_t id, FileDescriptor input)
{
    runningPager = id;
    std::signal(SIGPIPE, SIG_IGN);
    if (::isatty(STDERR_FILENO) == 1)
        errorsBefore = takePlaceOf(STDERR_FILENO, input.get());
    outputBefore = takePlaceOf(STDOUT_FILENO, input.get());
    // Whoever waits for the pager must not hold what it reads from open.
    input.reset();
    for (const int signal : endingSignals)
        handle(signal, waitAndEnd);
}

Pager::~Pager()
{
    std::fflush(stdout);
    // While the user reads, a key that interrupts is the pager's alone. It may be pressed as soon
    // as the pager sees the end.
    for (const int signal : endingSignals)
        handle(signal, SIG_IGN);
    giveBack(STDOUT_FILENO, outputBefore);
    giveBack(STDERR_FILENO, errorsBefore);
    waitForPager();
    for (const int signal : endingSignals)
        handle(signal, SIG_DFL);
}

}  // namespace orvane
