// SPDX-License-Identifier: Apache-2.0
#include "tests/terminal/ProgramTest.h"

namespace orvane::test {
namespace {

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
    const RunResult traced = run({"verify", "--details", "--trace", "sound"});
    const std::string& details = traced.output;
    EXPECT_NE(details.find(line), std::string::npos) << details;
    EXPECT_EQ(countOf("appears to be OK.", details), 1U) << details;
    EXPECT_NE(traced.errors.find("e2fsck -f -n"), std::string::npos) << traced.errors;
    EXPECT_EQ(details.find("-f -n"), std::string::npos) << details;
    const std::string next = run({"verify", "sound"}).output;
    EXPECT_EQ(next.find(line), std::string::npos) << next;
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
        EXPECT_EQ(result.output.find("█"), std::string::npos) << "no progress was wanted";
        for (const std::string_view look : {"\x1b[1m", "\x1b[31m", "\x1b[32m"})
            EXPECT_EQ(result.output.find(look) != std::string::npos, c.isColored) << c.because;
        EXPECT_EQ(result.output.find('\x1b') != std::string::npos, c.isColored) << c.because;
    }
}

// A check may take hours: who reads along, a window or a "tee", sees each row when it comes.
TEST_F(AppearanceTest, ARowIsSeenWhileTheToolStillWorks)
{
    useTool("say Pass 1: Checking inodes, blocks, and sizes\nwait");
    Launch started = launch({"verify", "--details", "sound"});
    started.limit = std::chrono::seconds(5);
    Program program(started);
    EXPECT_TRUE(program.waitFor("Checking inodes, blocks, and sizes"));
}

TEST_F(AppearanceTest, TheProgressLineIsErasedAtTheEnd)
{
    const std::string screen = runOnTerminal({"verify", "sound"}).output;
    const std::size_t drawn = screen.rfind("░");
    ASSERT_NE(drawn, std::string::npos) << screen;
    EXPECT_NE(screen.find("\r\x1b[K", drawn), std::string::npos) << "it was left";
}

/// Each of at most 16 bytes, and what it does.
const std::vector<std::pair<std::string, std::string_view>> hostileLabels{
    {"\x1b[2J\x1b]0;x\x07", "clears the screen and sets the title"},
    {"%@ %s %n %1$@ %d", "conversions"},
    {"a\nb\r\nc", "line ends"},
    {"\xff\xfe\xc0\x80 x", "no UTF-8"},
    {"\xc2\x9b"
     "31mred",
     "an eight-bit control sequence"},
    {"\xe2\x80\xaegnp.exe", "turns the direction"},
    {"\x1b[31mred\x1b[0m", "the marker of an error"},
    {"appears to be OK", "as near to a success as fits"},
};

using HostileLabelTest = ProgramTest;

// People look at events too; JSON can say every character in letters.
TEST_F(HostileLabelTest, NothingOfItReachesTheTerminalOrPassesForASuccess)
{
    const auto image = makeDamagedVolume("image", {"-O", "^metadata_csum"});
    for (const auto& [label, because] : hostileLabels) {
        // In sixteen bytes of the superblock, which has no checksum here.
        patch(image, 1024 + 120, label + std::string(16 - label.size(), '\0'));
        const RunResult result = run({"verify", "--details", "--json", "image"});
        EXPECT_EQ(result.status, 4) << because << result.output << result.errors;
        EXPECT_FALSE(holdsControls(result.output)) << because << result.output;
        const Events events(result.output);
        EXPECT_EQ(events.recordsWith("needs to be repaired.").size(), 1U) << because;
        for (const auto& record : events.named("record"))
            EXPECT_NE(record["type"], "SUCCESS") << because << record;
        for (const std::vector<std::string>& arguments :
             {std::vector<std::string>{"verify", "--details", "--log-level=3", "--trace", "image"},
              {"list", "image"},
              {"list", "--json", "image"},
              {"history", "image"},
              {"history", "--json", "image"}}) {
            const RunResult other = run(arguments);
            EXPECT_FALSE(holdsControls(other.output)) << because << "\n" << other.output;
            EXPECT_FALSE(holdsControls(other.errors)) << because << "\n" << other.errors;
        }
        std::string screen = runOnTerminal({"verify", "--details", "image"}).output;
        for (const std::string_view own :
             {"\x1b[1m", "\x1b[31m", "\x1b[32m", "\x1b[0m", "\x1b[K", "\r"})
            for (std::size_t at; (at = screen.find(own)) != std::string::npos;)
                screen.erase(at, own.size());
        EXPECT_FALSE(holdsControls(screen)) << because << "\n" << screen;
    }
}

}  // namespace
}  // namespace orvane::test
