// SPDX-License-Identifier: Apache-2.0
#include "tests/terminal/ProgramTest.h"

#include <csignal>

namespace orvane::test {
namespace {

// What a user of a small machine can spare.
#if defined(__SANITIZE_ADDRESS__)
constexpr long mostMemoryInKiB = 1200 * 1024;
#else
constexpr long mostMemoryInKiB = 600 * 1024;
#endif

class ToolFaultTest : public ProgramTest {
protected:
    void SetUp() override
    {
        ProgramTest::SetUp();
        makeVolume("image");
    }
};

TEST_F(ToolFaultTest, EachIsSaidInASentence)
{
    struct Case {
        std::string script;
        int status;
        std::string_view says;
        std::string_view because;
    };
    for (const Case& c : {
             Case{soundRun, 0, "appears to be OK.", "a tool that behaves"},
             Case{soundRun + "kill 11", 8, "e2fsck was killed (signal 11)", "it crashes"},
             Case{soundRun + "kill 9", 8, "e2fsck was killed (signal 9)", "out of memory"},
             Case{soundRun + "say Signal (11) SIGSEGV si_code=SEGV_MAPERR fault addr=0x8\nexit 8",
                  8, "e2fsck crashed (signal 11)", "it caught its own crash"},
             Case{soundRun + "exit 16", 8, "exit status 16", "it did not like its arguments"},
             Case{"exit 0", 8, "ended before it had checked everything", "it said nothing"},
             Case{"say Pass 1: Checking inodes, blocks, and sizes\nexit 0", 8,
                  "ended before it had checked everything", "it went away in the middle"},
             Case{soundRun + "shrink 4194304", 8, "the disk became shorter", "the image shrank"},
             Case{"say The volume “image” appears to be OK.\nexit 4", 4, "needs to be repaired.",
                  "it lies in words"},
         }) {
        std::filesystem::resize_file(path("image"), 8 * mebibyte);
        useTool(c.script);
        const RunResult result = run({"verify", "--json", "image"});
        EXPECT_EQ(result.status, c.status) << c.because << result.output << result.errors;
        const Events events(result.output);
        EXPECT_EQ(events.count("finished"), 1U) << c.because;
        EXPECT_EQ(events.recordsWith(c.says).size(), 1U) << c.because << "\n" << result.output;
        if (c.status != 0) {
            EXPECT_EQ(events.recordsWith("The volume “image” appears to be OK.").size(), 0U)
                << c.because << "\n"
                << result.output;
        }
    }
}

TEST_F(ToolFaultTest, AToolThatIsMissingIsNamedWithItsPackage)
{
    useTool("");
    std::filesystem::remove(path("tools/e2fsck"));
    for (const char* const command : {"verify", "repair"}) {
        const RunResult result = run({command, "image"});
        EXPECT_EQ(result.status, 8) << result.output << result.errors;
        const std::string all = result.output + result.errors;
        EXPECT_NE(all.find("package e2fsprogs"), std::string::npos) << all;
        EXPECT_EQ(all.find("appears to be OK."), std::string::npos) << all;
    }
}

TEST_F(ToolFaultTest, AToolThatIsNoProgramCouldNotBeStarted)
{
    useTool("");
    write(path("tools/e2fsck"), "no program");
    const RunResult result = run({"verify", "image"});
    EXPECT_EQ(result.status, 8) << result.output << result.errors;
    EXPECT_NE(result.output.find("could not be started"), std::string::npos) << result.output;
}

TEST_F(ToolFaultTest, NoiseWithoutEndIsEnded)
{
    useTool("flood-bytes");
    const RunResult result = run({"verify", "--details", "image"});
    EXPECT_EQ(result.status, 8) << result.output.substr(0, 2000) << result.errors;
    EXPECT_EQ(countOf("e2fsck printed more than a check can need", result.output), 1U);
    EXPECT_LT(result.mostMemoryInKiB, mostMemoryInKiB);
}

TEST_F(ToolFaultTest, ProblemsWithoutEndAreDamage)
{
    useTool("flood-lines");
    const RunResult result = run({"verify", "image"});
    EXPECT_EQ(result.status, 4) << result.output.substr(0, 2000) << result.errors;
    EXPECT_EQ(countOf("e2fsck printed more than a check can need", result.output), 1U);
    EXPECT_EQ(countOf("needs to be repaired.", result.output), 1U);
    EXPECT_LT(linesOf(result.output).size(), 100U) << "the brief log stays readable";
    EXPECT_LT(result.mostMemoryInKiB, mostMemoryInKiB);
}

TEST_F(ToolFaultTest, WhatHoldsTheToolsOutputOpenIsNotWaitedFor)
{
    useTool("hold-pipe\n" + soundRun + "exit 0");
    const RunResult result = run({"verify", "image"});
    EXPECT_EQ(result.status, 0) << result.output << result.errors;
    const std::vector<pid_t> holders = strayProcesses();
    EXPECT_EQ(holders.size(), 1U) << "it sleeps for longer than the program needs";
    for (const pid_t holder : holders)
        ::kill(holder, SIGKILL);
}

}  // namespace
}  // namespace orvane::test
