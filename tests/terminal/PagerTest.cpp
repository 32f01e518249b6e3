// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/Pager.h"
#include "tests/terminal/ProgramTest.h"

#include <sys/stat.h>

#include <csignal>
#include <thread>

namespace orvane::test {
namespace {

class PagerTest : public ProgramTest {
protected:
    /// A pager in the test's directory; its script's lines.
    void usePager(const std::string& script)
    {
        write(path("pager"), "#!/bin/sh\n" + script + "\n");
        ASSERT_EQ(::chmod(path("pager").c_str(), 0755), 0);
        environment_["PAGER"] = path("pager");
    }

    void waitForFile(std::string_view name) const
    {
        for (int i = 0; i < 3000 && !std::filesystem::exists(path(name)); ++i)
            std::this_thread::sleep_for(std::chrono::milliseconds(10));
        ASSERT_TRUE(std::filesystem::exists(path(name))) << name;
    }
};

TEST_F(PagerTest, LongOutputGoesThroughItOnATerminalAlone)
{
    makeVolume("sound");
    ASSERT_EQ(run({"verify", "sound"}).status, 0);
    usePager("sed s/^/paged:/");
    struct Case {
        std::vector<std::string> arguments;
        bool isPaged;
        std::string_view because;
    };
    for (const Case& c :
         {Case{{"history", "sound"}, true, "may be long"},
          Case{{"report", "sound"}, true, "the same"}, Case{{"help", "disks"}, true, "the same"},
          Case{{"help", "--no-pager", "disks"}, false, "not wanted"},
          Case{{"history", "--json", "sound"}, false, "for programs"},
          Case{{"history", "--clear", "sound"}, false, "nothing to read"},
          Case{{"list", "sound"}, false, "short"}, Case{{"help", "--help"}, false, "short"}}) {
        const RunResult result = runOnTerminal(c.arguments);
        EXPECT_EQ(result.status, 0) << c.because;
        EXPECT_EQ(result.output.find("paged:") != std::string::npos, c.isPaged)
            << c.arguments.front() << ": " << c.because;
    }
    EXPECT_EQ(run({"help", "disks"}).output.find("paged:"), std::string::npos) << "in a pipe";
}

TEST_F(PagerTest, ItIsNoShellAndItsLackIsNoLoss)
{
    for (const std::string_view pager :
         {"", "cat", " ", "/no/such/pager -x", "sed;touch pwned", "$(touch pwned)", "/"}) {
        environment_["PAGER"] = pager;
        const RunResult result = runOnTerminal({"help", "disks"});
        EXPECT_EQ(result.status, 0) << pager;
        EXPECT_NE(result.output.find("Disks, volumes"), std::string::npos) << pager;
        EXPECT_FALSE(std::filesystem::exists(path("pwned"))) << pager;
    }
    environment_["PAGER"] = "sed  -n  2p";
    EXPECT_EQ(linesOf(runOnTerminal({"help", "disks"}).output).size(), 1U) << "words at blanks";
    EXPECT_EQ(pagerCommand(std::nullopt).front(), "less");
}

TEST_F(PagerTest, ColoursAreHeededThere)
{
    usePager("cat -v");
    EXPECT_NE(runOnTerminal({"help", "disks"}).output.find("^[[1m"), std::string::npos);
    EXPECT_EQ(runOnTerminal({"help", "--color=never", "disks"}).output.find("^["),
              std::string::npos);
    environment_["NO_COLOR"] = "1";
    EXPECT_EQ(runOnTerminal({"help", "disks"}).output.find("^["), std::string::npos);
    EXPECT_EQ(runOnTerminal({"help", "disks", "--no-pager"}).output.find('\x1b'),
              std::string::npos);
}

/// A history that no pipe holds.
class LongHistoryTest : public PagerTest {
protected:
    void SetUp() override
    {
        PagerTest::SetUp();
        std::string script = "say Pass 1: Checking inodes, blocks, and sizes\n";
        for (int i = 0; i < 4000; ++i)
            script += "say A line of the tool, which says " + std::to_string(i) + "\n";
        makeVolume("sound");
        useTool(script + "exit 0");
        static_cast<void>(run({"verify", "sound"}));
    }
};

TEST_F(LongHistoryTest, APagerThatIsLeftEarlyIsNoError)
{
    usePager("head -n 1");
    const RunResult result = runOnTerminal({"history", "--details", "sound"});
    EXPECT_EQ(result.signal, 0);
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(linesOf(result.output).size(), 1U) << result.output;
}

// Both would read the terminal otherwise: the shell, and the pager that is still there.
TEST_F(LongHistoryTest, AnInterruptionWaitsForThePager)
{
    struct Case {
        std::string_view script;
        int signal;
        std::string_view because;
    };
    for (const Case& c : {Case{"trap '' INT; touch began; until [ -e go ]; do sleep 0.02; done; "
                               "cat >all; touch ended",
                               SIGINT, "while there is more to be written"},
                          Case{"trap '' INT; cat >all; touch began; until [ -e go ]; do sleep "
                               "0.02; done; touch ended",
                               0, "while all is written, and somebody reads"}}) {
        for (const char* const name : {"began", "go", "ended"})
            std::filesystem::remove(path(name));
        usePager(std::string(c.script));
        Launch started = launch({"history", "--details", "sound"});
        started.columns = 80;
        Program program(started);
        waitForFile("began");
        program.signal(SIGINT);
        program.waitUntilSignalsAreTaken();
        write(path("go"), {});
        EXPECT_EQ(program.finish().signal, c.signal) << c.because;
        EXPECT_TRUE(std::filesystem::exists(path("ended"))) << c.because;
    }
}

}  // namespace
}  // namespace orvane::test
