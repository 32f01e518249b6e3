// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/FileDescriptor.h"
#include "tests/support/TestDirectory.h"

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <sys/types.h>
#include <chrono>
#include <cstdint>
#include <filesystem>
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
    int status = -1;     ///< -1 when a signal ended it
    int signal = 0;      ///< 0 when it exited
    std::string output;  ///< standard output; on a terminal all that came on the screen
    std::string errors;  ///< standard error; on a terminal nothing
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

inline constexpr std::uint64_t mebibyte = 1U << 20U;

/// The events of a run with --json. A line that is no JSON object with an "event" fails the test.
class Events {
public:
    explicit Events(std::string_view output);

    const std::vector<nlohmann::json>& all() const { return all_; }
    std::vector<nlohmann::json> named(std::string_view event) const;
    std::size_t count(std::string_view event) const { return named(event).size(); }
    /// "started a.img", "finished a.img sound", "alert", ...: the events of these names, in order.
    std::vector<std::string> story(const std::vector<std::string>& names) const;
    /// The records whose text holds `part`.
    std::vector<nlohmann::json> recordsWith(std::string_view part) const;

private:
    std::vector<nlohmann::json> all_;
};

/// A user with a directory of images, who has never used the program before. When the test ends no
/// process that came from it may be left.
class ProgramTest : public ::testing::Test {
protected:
    ProgramTest();

    void SetUp() override;
    void TearDown() override;

    /// Started in the test's directory.
    Launch launch(std::vector<std::string> arguments) const;
    /// In pipes, to the end.
    RunResult run(std::vector<std::string> arguments) const;
    /// On a terminal of 80 columns, to the end.
    RunResult runOnTerminal(std::vector<std::string> arguments) const;

    std::filesystem::path path(std::string_view name) const { return directory_ / name; }

    /// A sparse file with a sound volume.
    std::filesystem::path makeVolume(std::string_view name, std::uint64_t bytes = 8 * mebibyte,
                                     const std::vector<std::string>& options = {}) const
    {
        return directory_.makeExt(name, bytes, options);
    }
    /// A volume that a check has to read for a second or longer.
    std::filesystem::path makeSlowVolume(std::string_view name) const;
    /// debugfs(8), writing.
    void change(const std::filesystem::path& image, const std::string& command) const
    {
        directory_.damage(image, command);
    }
    /// A volume that has lost its root directory.
    std::filesystem::path makeDamagedVolume(std::string_view name,
                                            const std::vector<std::string>& options = {}) const;
    /// A disk with a partition of as many MiB for each volume, one after the other from the first
    /// MiB on, and one MiB after the last.
    std::filesystem::path makeDisk(std::string_view name,
                                   const std::vector<std::filesystem::path>& volumes,
                                   std::string_view label = "gpt") const;

    /// From now on e2fsck does what the script says; it is described in the fake tool's source.
    void useTool(std::string_view script)
    {
        environment_["FIXWELL_TOOL_PATH"] = directory_.fakeTools(script);
    }

private:
    TestDirectory directory_;  // before the environment, which names it

protected:
    std::map<std::string, std::string> environment_;
};

/// Ends all processes that were left to the test, and tells how many there were. Those that are
/// about to end by themselves are waited for.
int endStrayProcesses();
std::vector<std::string> linesOf(std::string_view text);
std::size_t countOf(std::string_view part, std::string_view text);
/// Whether a terminal would find something to obey in it, apart from line ends.
bool holdsControls(std::string_view text);

}  // namespace orvane::test
