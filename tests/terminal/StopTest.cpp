// SPDX-License-Identifier: Apache-2.0
#include "tests/support/TestDirectory.h"
#include "tests/terminal/ProgramTest.h"

#include <csignal>

namespace orvane::test {
namespace {

constexpr std::string_view controlC = "\x03";

class StopTest : public ProgramTest {
protected:
    /// Interrupts the program as soon as it has said `text`.
    RunResult stopAfter(std::string_view text, std::vector<std::string> arguments,
                        int signal = SIGINT) const
    {
        Program program(launch(std::move(arguments)));
        EXPECT_TRUE(program.waitFor(text)) << program.output();
        program.signal(signal);
        return program.finish();
    }
};

TEST_F(StopTest, TheFirstOfThreeImagesIsTheLast)
{
    std::string before;
    for (const char* const name : {"a", "b", "c"})
        before += contentsOf(makeVolume(name));
    useTool("say Pass 1: Checking inodes, blocks, and sizes\nwait");
    for (const int signal : {SIGINT, SIGTERM, SIGHUP}) {
        const RunResult result =
            stopAfter("\"started\"", {"verify", "--details", "--json", "a", "b", "c"}, signal);
        EXPECT_EQ(result.status, 32) << result.output << result.errors;
        const Events events(result.output);
        const std::vector<std::string> story{"started a", "finished a stopped"};
        EXPECT_EQ(events.story({"started", "finished"}), story);
        EXPECT_EQ(events.recordsWith("Stopped by user").size(), 1U) << result.output;
        EXPECT_EQ(events.recordsWith("appears to be OK.").size(), 0U) << result.output;
    }
    EXPECT_TRUE(contentsOf(path("a")) + contentsOf(path("b")) + contentsOf(path("c")) == before);
}

// One press would leave a repair twenty seconds to come to an order by itself.
TEST_F(StopTest, AToolThatDoesNotListenIsEndedByTheThirdControlC)
{
    makeVolume("image");
    useTool("ignore 2\nignore 15\nsay Pass 1: Checking inodes, blocks, and sizes\nwait");
    Launch started = launch({"repair", "--details", "--no-progress", "image"});
    started.columns = 80;
    started.limit = std::chrono::seconds(12);
    Program program(started);
    ASSERT_TRUE(program.waitFor("Checking inodes, blocks, and sizes"));
    for (int presses = 1; presses <= 3; ++presses) {
        program.type(controlC);
        ASSERT_TRUE(program.waitFor("^C", presses)) << program.output();
        program.waitUntilSignalsAreTaken();
    }
    const RunResult& result = program.finish();
    EXPECT_EQ(result.status, 32) << result.output;
    EXPECT_EQ(countOf("Stopped by user", result.output), 1U) << result.output;
}

TEST_F(StopTest, ARepairThatWasCutOffIsMadeGoodByTheNext)
{
    for (const int signal : {SIGINT, SIGKILL}) {
        const auto image = makeSlowVolume("image");
        change(image, "ssv free_blocks_count 1");
        change(image, "clri <11>");
        const RunResult stopped = stopAfter("\"record\"", {"repair", "--json", "image"}, signal);
        EXPECT_EQ(stopped.status, signal == SIGINT ? 32 : -1) << stopped.output << stopped.errors;
        EXPECT_EQ(countOf("was repaired successfully.", stopped.output), 0U);
        EXPECT_EQ(endStrayProcesses(), 0) << "the tool goes with the program";
        const RunResult repaired = run({"repair", "image"});
        EXPECT_LE(repaired.status, 1) << repaired.output << repaired.errors;
        EXPECT_EQ(runTool({"e2fsck", "-fn", image}).status, 0);
    }
}

// What the user saw before the machine or the program went down is in the history.
TEST_F(StopTest, EveryRecordThatWasSeenBeforeAKillIsKept)
{
    makeVolume("image");
    std::string script;
    for (int i = 0; i < 3000; ++i)
        script += "say Line number " + std::to_string(i) + " of many\nsleep 1\n";
    useTool(script + "wait");
    std::string seen;
    {
        Program program(launch({"verify", "--details", "--json", "image"}));
        ASSERT_TRUE(program.waitFor("Line number 300 of many")) << program.output();
        program.signal(SIGKILL);
        EXPECT_EQ(program.finish().signal, SIGKILL);
        seen = program.output();
    }
    EXPECT_EQ(endStrayProcesses(), 0) << "the tool goes with the program";
    seen.erase(seen.rfind('\n') + 1);  // the last line may have been cut
    const Events kept(run({"history", "--details", "--json", "image"}).output);
    const auto told = Events(seen).named("record");
    const auto records = kept.named("record");
    ASSERT_GT(told.size(), 300U);
    ASSERT_GE(records.size(), told.size());
    EXPECT_TRUE(std::equal(told.begin(), told.end(), records.begin()));
    ASSERT_EQ(kept.count("run"), 1U);
    EXPECT_TRUE(kept.named("run").front()["verdict"].is_null()) << "nobody knows the verdict";
}

// Nobody reads any more, as with "| head": the check goes on to its end.
TEST_F(StopTest, OutputThatNobodyReadsEndsNothing)
{
    const auto image = makeDamagedVolume("image");
    Program program(launch({"repair", "image"}));
    program.stopReading();
    static_cast<void>(program.finish());
    EXPECT_EQ(runTool({"e2fsck", "-fn", image}).status, 0) << "the repair was not finished";
}

}  // namespace
}  // namespace orvane::test
