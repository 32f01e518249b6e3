// SPDX-License-Identifier: Apache-2.0
#include "tests/terminal/ProgramTest.h"

namespace orvane::test {
namespace {

constexpr std::string_view bold = "\x1b[1m";
constexpr std::string_view red = "\x1b[31m";
constexpr std::string_view green = "\x1b[32m";
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

TEST_F(AppearanceTest, DetailsShowTheToolsLinesAndBriefDoesNot)
{
    const std::string details = run({"verify", "--details", "sound"}).output;
    const std::string brief = run({"verify", "--brief", "sound"}).output;
    EXPECT_NE(details.find("Checking directory structure"), std::string::npos) << details;
    EXPECT_EQ(brief.find("Checking directory structure"), std::string::npos) << brief;
    for (const std::string& output : {details, brief})
        EXPECT_EQ(countOf("appears to be OK.", output), 1U) << output;
}

TEST_F(AppearanceTest, DetailsOfOneRunAreNotKeptAsAPreference)
{
    static_cast<void>(run({"verify", "--details", "sound"}));
    const std::string next = run({"verify", "sound"}).output;
    EXPECT_EQ(next.find("Checking directory structure"), std::string::npos) << next;
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
             Case{false, {}, {}, false, "a pipe is for other programs"},
             Case{false, {"--color=auto"}, {}, false, "the same"},
             Case{false, {"--color=always"}, {}, true, "into a pager, say"},
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
        for (const std::string_view look : {bold, red, green})
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
          {"verify", "--json", "sound", "damaged"},
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

TEST_F(AppearanceTest, EveryLineGivesItsColourBack)
{
    const std::string output =
        run({"verify", "--details", "--color=always", "sound", "damaged"}).output;
    for (const std::string& line : linesOf(output))
        if (line.find('\x1b') != std::string::npos) {
            EXPECT_TRUE(line.ends_with("\x1b[0m")) << line;
        }
}

TEST_F(AppearanceTest, AProgressLineIsShownAndErasedAtTheEnd)
{
    for (const unsigned short columns : {20, 80, 200}) {
        Launch started = launch({"verify", "sound"});
        started.columns = columns;
        const RunResult result = Program(started).finish();
        const std::size_t lastLine = result.output.rfind(fullCell);
        ASSERT_NE(lastLine, std::string::npos) << result.output;
        EXPECT_NE(result.output.find(eraseLine, lastLine), std::string::npos) << "it was left";
        EXPECT_TRUE(result.output.ends_with("\n") || result.output.ends_with(eraseLine));
    }
}

// A line that wraps could not be erased.
TEST_F(AppearanceTest, TheProgressLineIsNarrowerThanTheTerminal)
{
    for (const unsigned short columns : {2, 10, 30, 80}) {
        Launch started = launch({"verify", "sound"});
        started.columns = columns;
        const std::string screen = Program(started).finish().output;
        std::size_t at = screen.find(eraseLine);
        ASSERT_NE(at, std::string::npos);
        for (; at != std::string::npos; at = screen.find(eraseLine, at)) {
            at += eraseLine.size();
            const std::string drawn = screen.substr(at, screen.find_first_of("\r\n", at) - at);
            if (!drawn.starts_with(fullCell) && !drawn.starts_with("░"))
                continue;  // a row of the log
            const auto characters = std::count_if(drawn.begin(), drawn.end(), [](char byte) {
                return (static_cast<unsigned char>(byte) & 0xC0U) != 0x80;
            });
            EXPECT_LT(characters, columns) << drawn;
        }
    }
}

TEST_F(AppearanceTest, NoProgressMeansNone)
{
    const RunResult result = runOnTerminal({"verify", "--no-progress", "sound"});
    EXPECT_EQ(result.output.find(fullCell), std::string::npos) << result.output;
    EXPECT_EQ(result.output.find(eraseLine), std::string::npos) << result.output;
}

TEST_F(AppearanceTest, TheVerdictComesInTheUsersLanguage)
{
    environment_["LANGUAGE"] = "de";
    const RunResult sound = run({"verify", "--json", "sound"});
    EXPECT_EQ(sound.status, 0) << sound.output;
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

TEST_F(AppearanceTest, TraceShowsTheCommandBeforeItRuns)
{
    const RunResult result = run({"verify", "--trace", "sound"});
    EXPECT_NE(result.errors.find("e2fsck -f -n"), std::string::npos) << result.errors;
    EXPECT_EQ(result.output.find("-f -n"), std::string::npos) << result.output;
}

}  // namespace
}  // namespace orvane::test
