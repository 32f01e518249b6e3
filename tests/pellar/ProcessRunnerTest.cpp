// SPDX-License-Identifier: Apache-2.0
#include "pellar/process/ProcessRunner.h"

#include "tests/pellar/JobFixture.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/wait.h>

#include <cerrno>
#include <csignal>

namespace {

using namespace std::chrono_literals;
using namespace pellar;

std::vector<std::string> split(const std::vector<std::string>& pieces)
{
    std::vector<std::string> lines;
    LineSplitter splitter(8, [&lines](std::string_view line, bool isCut) {
        lines.push_back(std::string(line) + (isCut ? "[cut]" : ""));
    });
    for (const std::string& piece : pieces)
        splitter.take(piece);
    splitter.finish();
    return lines;
}

TEST(LineSplitter, CutsAtEveryLineEnd)
{
    using namespace std::string_literals;
    using Texts = std::vector<std::string>;
    for (const auto& [pieces, lines] :
         {std::pair(Texts{"a\nb\n"}, Texts{"a", "b"}),  // the last end makes no empty line
          {{"a\r\nb\rc"}, {"a", "b", "c"}},             // three kinds of ends, and none
          {{"a\r", "\nb"}, {"a", "b"}},                 // one end, torn apart
          {{"a\r", "", "\n\nb"}, {"a", "", "b"}},
          {{"a\r\r\nb"}, {"a", "", "b"}},
          {{"a\0\xFF\n"s}, {"a\0\xFF"s}},
          {{"12345678\n"}, {"12345678"}},  // just as long as may be
          {{"123456789", "more\nb\n"}, {"12345678[cut]", "b"}},
          {{"12345678", "9"}, {"12345678[cut]"}}})
        EXPECT_EQ(split(pieces), lines) << lines.front();
}

const Clock::time_point start{};

TEST(StopLadder, LeavingKillsAReaderAndGivesAWriterAMoment)
{
    EXPECT_EQ(StopLadder(graceTimesFor(Access::ReadOnly)).pressHard(start), SIGKILL);
    StopLadder writer(graceTimesFor(Access::ReadWrite));
    EXPECT_EQ(writer.pressHard(start), SIGINT);
    EXPECT_EQ(writer.pressHard(start + 1s), 0) << "once is enough";
    EXPECT_EQ(writer.due(start + 2999ms), 0);
    EXPECT_EQ(writer.due(start + 3s), SIGKILL);
    EXPECT_FALSE(writer.deadline());
    EXPECT_EQ(writer.press(start + 6s), 0) << "there is nothing harder";
}

/// Keeps the lines; presses the stop switch at the first one when asked to.
class Lines final : public RunListener {
public:
    void line(std::string_view line, bool) override
    {
        output.emplace_back(line);
        if (onLine)
            onLine();
    }
    void progressLine(std::string_view line) override { progress.emplace_back(line); }
    void lineLimitReached() override { ++limits; }
    void pause() override {}
    void tick() override {}

    std::vector<std::string> output;
    std::vector<std::string> progress;
    int limits = 0;
    std::function<void()> onLine;
};

struct Runner {
    RunResult run(std::string_view script)
    {
        request.command = {directory.fakeTools(script) + "/e2fsck", {}};
        return runTool(request, stop, lines);
    }

    test::TestDirectory directory;
    RunRequest request{{}, Access::ReadOnly, -1, {}, 0ms, {100ms, 100ms, 0ms}};
    StopSwitch stop;
    Lines lines;
};

/// Nothing of ours is left: not even an ended process that is still to be reaped.
void expectNoChildren()
{
    EXPECT_EQ(::waitpid(-1, nullptr, WNOHANG), -1);
    EXPECT_EQ(errno, ECHILD);
}

TEST(ProcessRunner, TellsHowAToolEnded)
{
    for (const auto& [script, ending] : {std::pair("say a\nexit 0", Ending(Exited{0})),
                                         {"say a\nexit 137", Exited{137}},
                                         {"say a\nkill 9", Killed{9}}}) {
        Runner runner;
        const RunResult result = runner.run(script);
        EXPECT_EQ(result.ending, ending) << script;
        EXPECT_EQ(result.cause, StopCause::None) << script;
        EXPECT_EQ(runner.lines.output, std::vector<std::string>{"a"}) << script;
        expectNoChildren();
    }
}

TEST(ProcessRunner, SaysWhyAToolDidNotStart)
{
    Runner runner;
    runner.request.command = {runner.directory.path("nothing"), {}};
    EXPECT_EQ(runTool(runner.request, runner.stop, runner.lines).ending,
              Ending(NotStarted{ENOENT}));
    runner.directory.write("text", "no program");
    std::filesystem::permissions(runner.directory.path("text"), std::filesystem::perms::owner_all);
    runner.request.command = {runner.directory.path("text"), {}};
    EXPECT_EQ(runTool(runner.request, runner.stop, runner.lines).ending,
              Ending(NotStarted{ENOEXEC}));
    expectNoChildren();
}

TEST(ProcessRunner, GivesTheToolNothingButItsOwn)
{
    ::setenv("E2FSCK_CONFIG", "/tmp/hostile", 1);
    const FileDescriptor disk(::open("/dev/null", O_RDONLY | O_CLOEXEC));
    const FileDescriptor leaked(::open("/dev/null", O_RDONLY));  // not closed on exec
    Runner runner;
    runner.request.disk = disk.get();
    (void)runner.run("environment\ndescriptors\nprogress 1 2 3");
    EXPECT_EQ(
        runner.lines.output,
        (std::vector<std::string>{"environment PATH=/usr/sbin:/usr/bin:/sbin:/bin",
                                  "environment LC_ALL=C", "environment LANG=C", "descriptor 0",
                                  "descriptor 1", "descriptor 2", "descriptor 3", "descriptor 4",
                                  // the script that the fake tool reads
                                  "descriptor 5"}));
    EXPECT_EQ(runner.lines.progress, std::vector<std::string>{"1 2 3"});
    ::unsetenv("E2FSCK_CONFIG");
}

TEST(ProcessRunner, EndsAToolThatWillNotStop)
{
    for (const auto& [script, signal] : {std::pair("say a\nwait", SIGINT),
                                         {"ignore 2\nsay a\nwait", SIGTERM},
                                         {"ignore 2\nignore 15\nsay a\nwait", SIGKILL}}) {
        Runner runner;
        runner.lines.onLine = [&runner] {
            runner.stop.press();
        };
        const RunResult result = runner.run(script);
        EXPECT_EQ(result.ending, Ending(Killed{signal})) << script;
        EXPECT_EQ(result.cause, StopCause::User) << script;
        expectNoChildren();
    }
}

TEST(ProcessRunner, BoundsWhatAToolPrints)
{
    struct Case {
        std::string_view script;
        Access access;
        bool ignoresStops;
        std::size_t mostBytes;
        std::size_t lines;
        std::string_view because;
    };
    constexpr std::size_t many = 1U << 30U;
    for (const Case& c : {
             Case{"flood-lines", Access::ReadOnly, false, many, 1000, "lines"},
             Case{"flood-bytes", Access::ReadOnly, false, 1U << 20U, 1, "one line, cut"},
             Case{"flood-lines", Access::ReadWrite, false, many, 1000, "a repair, unheard first"},
             Case{"flood-lines", Access::ReadWrite, true, many, 1000, "it ignores being asked"},
         }) {
        Runner runner;
        runner.request.access = c.access;
        runner.request.ignoresStops = c.ignoresStops;
        runner.request.limits = {1000, c.mostBytes};
        runner.request.graceTimes = {c.ignoresStops ? 24h : 100ms, 100ms, 50ms};
        const RunResult result = runner.run(c.script);
        EXPECT_EQ(result.cause, StopCause::TooMuchOutput) << c.because;
        EXPECT_EQ(runner.lines.output.size(), c.lines) << c.because;
        EXPECT_EQ(runner.lines.limits, c.access == Access::ReadWrite ? 1 : 0) << c.because;
        ASSERT_FALSE(runner.lines.output.empty()) << c.because;
        EXPECT_LE(runner.lines.output.back().size(), longestToolLine) << c.because;
        EXPECT_EQ(result.ending, Ending(Killed{c.ignoresStops ? SIGKILL : SIGINT})) << c.because;
    }
    expectNoChildren();
}

TEST(ProcessRunner, EndsASilentToolOnlyWhenAskedTo)
{
    Runner runner;
    runner.request.silenceLimit = 50ms;
    EXPECT_EQ(runner.run("say a\nwait").cause, StopCause::Silence);
    runner.request.silenceLimit = 0ms;
    EXPECT_EQ(runner.run("say a\nsleep 200\nexit 0").cause, StopCause::None);
}

TEST(ProcessRunner, IsNotHeldUpByWhatTheToolLeftBehind)
{
    Runner runner;
    const auto before = std::chrono::steady_clock::now();
    EXPECT_EQ(runner.run("hold-pipe\nsay a\nexit 0").ending, Ending(Exited{0}));
    // The grandchild keeps the pipe open for five seconds.
    EXPECT_LT(std::chrono::steady_clock::now() - before, 4s);
    EXPECT_EQ(runner.lines.output, std::vector<std::string>{"a"});
}

TEST(ProcessRunner, GivesATerminalToAToolThatWantsOne)
{
    for (const bool wantsIt : {false, true}) {
        Runner runner;
        runner.request.wantsTerminal = wantsIt;
        std::string script = "terminal\n";
        for (int i = 0; i < 3000; ++i)
            script += "say line " + std::to_string(i) + "\n";
        const RunResult result = runner.run(script + "exit 3");
        EXPECT_EQ(result.ending, Ending(Exited{3}));
        ASSERT_EQ(runner.lines.output.size(), 3001U) << "what was written last is told as well";
        EXPECT_EQ(runner.lines.output.front(),
                  wantsIt ? "terminal 1 input 0 columns 1000" : "terminal 0 input 0 columns 0");
        EXPECT_EQ(runner.lines.output.back(), "line 2999") << "and nothing is added to it";
    }
    expectNoChildren();
}

TEST(ProcessRunner, LetsAWriterComeToItsEndThatWouldBreakOff)
{
    Runner runner;
    runner.request.access = Access::ReadWrite;
    runner.request.ignoresStops = true;
    runner.request.graceTimes = graceTimesOfUnstoppable();
    runner.lines.onLine = [&runner] {
        if (runner.lines.output.size() == 1)
            for (int i = 0; i < 2; ++i)
                runner.stop.press();
    };
    const RunResult result = runner.run("say begun\nsleep 200\nsay done\nexit 1");
    EXPECT_EQ(result.ending, Ending(Exited{1}));
    EXPECT_EQ(result.cause, StopCause::User);
    EXPECT_EQ(runner.lines.output.back(), "done");

    Runner insisting;
    insisting.request = runner.request;
    insisting.lines.onLine = [&insisting] {
        for (int i = 0; i < 3; ++i)
            insisting.stop.press();
    };
    EXPECT_EQ(insisting.run("say begun\nwait").ending, Ending(Killed{SIGKILL}))
        << "who asks three times has his way";
    expectNoChildren();
}

TEST(ProcessRunner, DoesNotStartWhatIsAlreadyStopped)
{
    Runner runner;
    runner.stop.press();
    EXPECT_EQ(runner.run("say a").cause, StopCause::User);
    EXPECT_TRUE(runner.lines.output.empty());
}

}  // namespace
