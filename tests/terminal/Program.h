// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/FileDescriptor.h"

#include <sys/types.h>

#include <chrono>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace orvane::test {

using pellar::FileDescriptor;

/// How the program is to be started.
struct Launch {
    std::vector<std::string> arguments;
    std::map<std::string, std::string> environment;  ///< all of it
    std::string directory;                           ///< where it is started
    std::optional<uid_t> user;                       ///< else the test's own
    std::chrono::seconds limit{60};                  ///< a longer run is killed
    enum class Output { Read, Closed, Full };
    Output output = Output::Read;           ///< in pipes: or none at all, or a device that is full
    std::optional<unsigned short> columns;  ///< on a pseudo-terminal of this width, else in pipes
};

/// What a run left behind.
struct RunResult {
    int status = -1;           ///< -1 when a signal ended it
    int signal = 0;            ///< 0 when it exited
    std::string output;        ///< standard output; on a terminal all that came on the screen
    std::string errors;        ///< standard error; on a terminal nothing
    long mostMemoryInKiB = 0;  ///< of the program or a tool, whichever took more
};

/// One run of the program, ended with this object at the latest. A run that takes longer than the
/// limit is killed and fails the test.
class Program {
public:
    explicit Program(const Launch& launch);
    Program(const Program&) = delete;
    Program& operator=(const Program&) = delete;
    ~Program();

    /// Reads until standard output holds `text` so many times; NO when the program ended, or the
    /// limit came, without it.
    [[nodiscard]] bool waitFor(std::string_view text, int times = 1);
    /// Types on the terminal.
    void type(std::string_view bytes);
    void signal(int number);
    /// Until the program has taken up every signal it was sent; two of a kind that wait are one.
    void waitUntilSignalsAreTaken() const;
    /// Closes the reading ends, as a pager does that the user has left.
    void stopReading();
    /// What has come on standard output so far.
    const std::string& output() const { return result_.output; }
    /// Reads all that is left, and waits for the end.
    const RunResult& finish();

private:
    using Clock = std::chrono::steady_clock;

    void startInPipes(const Launch& launch);
    void startOnTerminal(const Launch& launch);
    bool readMore();
    void take(FileDescriptor& from, std::string& into);
    void reap();

    const Clock::time_point deadline_;
    pid_t id_ = 0;  ///< 0 when there is none to wait for
    FileDescriptor end_;
    FileDescriptor output_;
    FileDescriptor errors_;
    RunResult result_;
};

}  // namespace orvane::test
