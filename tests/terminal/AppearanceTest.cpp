// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/TerminalText.h"
#include "tests/terminal/ProgramTest.h"

namespace orvane::test {
namespace {

constexpr std::string_view eraseLine = "\r\x1b[K";
constexpr std::string_view fullCell = "█";

class AppearanceTest : public ProgramTest {
protected:
    void SetUp() override
    {
        ProgramTest::SetUp();
        makeVolume("sound");
        makeDamagedVolume("damaged");
    }
};

TEST_F(AppearanceTest, DetailsShowTheToolsLinesForThisOnce)
{
    constexpr std::string_view line = "Checking directory structure";
    const std::string details = run({"verify", "--details", "sound"}).output;
    EXPECT_NE(details.find(line), std::string::npos) << details;
    EXPECT_EQ(countOf("appears to be OK.", details), 1U) << details;
    const std::string next = run({"verify", "sound"}).output;
    EXPECT_EQ(next.find(line), std::string::npos) << next;
    EXPECT_EQ(countOf("appears to be OK.", next), 1U) << next;
}

TEST_F(AppearanceTest, ColoursAreForTerminalsUnlessTheUserSaysOtherwise)
{
    struct Case {
        bool onTerminal;
        std::vector<std::string> options;
        std::map<std::string, std::string> environment;
        bool isColored;
        std::string_view because;
    };
    for (const Case& c : {
             Case{false, {"--color=auto"}, {}, false, "a pipe is for other programs"},
             Case{false, {"--color=always"}, {{"NO_COLOR", "1"}}, true, "the option outranks"},
             Case{true, {}, {}, true, "a terminal"},
             Case{true, {"--color=never"}, {}, false, "not wanted"},
             Case{true, {}, {{"NO_COLOR", "1"}}, false, "never wanted"},
             Case{true, {}, {{"NO_COLOR", ""}}, true, "an empty NO_COLOR says nothing"},
             Case{true, {}, {{"TERM", "dumb"}}, false, "it could not show them"},
         }) {
        Launch started = launch({"verify", "--no-progress", "sound", "damaged"});
        started.arguments.insert(started.arguments.end(), c.options.begin(), c.options.end());
        for (const auto& [name, value] : c.environment)
            started.environment[name] = value;
        if (c.onTerminal)
            started.columns = 80;
        const RunResult result = Program(started).finish();
        EXPECT_EQ(result.status, 4) << c.because;
        EXPECT_EQ(result.output.find(fullCell), std::string::npos) << "no progress was wanted";
        for (const std::string_view look : {"\x1b[1m", "\x1b[31m", "\x1b[32m"})
            EXPECT_EQ(result.output.find(look) != std::string::npos, c.isColored) << c.because;
        if (!c.isColored) {
            EXPECT_EQ(result.output.find('\x1b'), std::string::npos) << c.because;
        }
    }
}

TEST_F(AppearanceTest, APipeSeesNoEscapeAndNoProgressLine)
{
    for (const std::vector<std::string>& arguments :
         {std::vector<std::string>{"verify", "--details", "sound", "damaged"},
          {"list", "sound"},
          {"history", "sound"},
          {"repair", "damaged"}}) {
        const RunResult result = run(arguments);
        EXPECT_FALSE(holdsControls(result.output)) << result.output;
        EXPECT_EQ(result.output.find(fullCell), std::string::npos) << result.output;
        EXPECT_EQ(result.errors, "") << arguments.front();
    }
}

// A check may take hours: who reads along, a window or a "tee", sees each row when it comes.
TEST_F(AppearanceTest, ARowIsSeenWhileTheToolStillWorks)
{
    useTool("say Pass 1: Checking inodes, blocks, and sizes\nwait");
    for (const char* const option : {"--json", "--color=auto"}) {
        Launch started = launch({"verify", "--details", option, "sound"});
        started.limit = std::chrono::seconds(5);
        Program program(started);
        EXPECT_TRUE(program.waitFor("Checking inodes, blocks, and sizes")) << option;
    }
}

// A line that wraps could not be erased.
TEST_F(AppearanceTest, TheProgressLineFitsTheTerminalAndIsErasedAtTheEnd)
{
    for (const unsigned short columns : {2, 30, 80}) {
        Launch started = launch({"verify", "sound"});
        started.columns = columns;
        const std::string screen = Program(started).finish().output;
        std::size_t drawnLines = 0;
        for (std::size_t at = screen.find(eraseLine); at != std::string::npos;
             at = screen.find(eraseLine, at)) {
            at += eraseLine.size();
            const std::string drawn = screen.substr(at, screen.find_first_of("\r\n", at) - at);
            if (!drawn.starts_with(fullCell) && !drawn.starts_with("░"))
                continue;  // a row of the log
            ++drawnLines;
            EXPECT_EQ(fittedTo(drawn, columns - 1U), drawn) << columns;
            EXPECT_NE(screen.find(eraseLine, at), std::string::npos) << "it was left";
        }
        EXPECT_GT(drawnLines, 0U) << screen;
    }
}

TEST_F(AppearanceTest, TheVerdictComesInTheUsersLanguage)
{
    environment_["LANGUAGE"] = "de";
    const RunResult sound = run({"verify", "--json", "sound"});
    const auto verdict = Events(sound.output).recordsWith("scheint in Ordnung zu sein.");
    ASSERT_EQ(verdict.size(), 1U) << sound.output;
    EXPECT_EQ(verdict.front()["type"], "SUCCESS");
    const RunResult damaged = run({"verify", "damaged"});
    EXPECT_EQ(damaged.status, 4);
    EXPECT_NE(damaged.output.find("muss repariert werden."), std::string::npos) << damaged.output;

    environment_["LC_ALL"] = "C";
    EXPECT_NE(run({"verify", "sound"}).output.find("appears to be OK."), std::string::npos)
        << "the C locale is English, whatever LANGUAGE says";
}

TEST_F(AppearanceTest, TraceShowsTheCommandBesideTheOutput)
{
    const RunResult result = run({"verify", "--trace", "sound"});
    EXPECT_NE(result.errors.find("e2fsck -f -n"), std::string::npos) << result.errors;
    EXPECT_EQ(result.output.find("-f -n"), std::string::npos) << result.output;
}

}  // namespace
}  // namespace orvane::test
