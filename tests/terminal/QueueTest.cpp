// SPDX-License-Identifier: Apache-2.0
#include "tests/terminal/ProgramTest.h"

namespace orvane::test {
namespace {

class QueueTest : public ProgramTest {
protected:
    void SetUp() override
    {
        ProgramTest::SetUp();
        makeVolume("a");
        makeDamagedVolume("b");
        makeVolume("c");
    }
};

TEST_F(QueueTest, EveryImageStartsAndFinishesInItsTurn)
{
    const RunResult result = run({"verify", "--json", "a", "b", "c"});
    EXPECT_EQ(result.status, 4);
    EXPECT_EQ(result.errors, "");
    const std::vector<std::string> story{
        "started a", "finished a sound", "started b", "finished b damaged",
        "started c", "finished c sound", "report",    "alert"};
    EXPECT_EQ(Events(result.output).story({"started", "finished", "report", "alert"}), story);
}

TEST_F(QueueTest, TheOneAlertNamesTheImageAndTheRecordsTheirOwn)
{
    const Events events(run({"verify", "--json", "a", "b", "c"}).output);
    ASSERT_EQ(events.count("alert"), 1U);
    const std::string title = events.named("alert").front()["title"];
    EXPECT_NE(title.find("“b”"), std::string::npos) << title;
    for (const auto& record : events.recordsWith("Root inode"))
        EXPECT_EQ(record["disk"], "b") << record;
    for (const auto& record : events.recordsWith("appears to be OK."))
        EXPECT_NE(record["disk"], "b") << record;
    EXPECT_EQ(events.recordsWith("appears to be OK.").size(), 2U);
}

TEST_F(QueueTest, RecordsStandBetweenTheStartAndTheEndOfTheirImage)
{
    const Events events(run({"verify", "--details", "--json", "a", "b", "c"}).output);
    std::string current;
    for (const auto& event : events.all()) {
        if (event["event"] == "started")
            current = event["disk"];
        else if (event["event"] == "finished")
            current.clear();
        else if (event["event"] == "record") {
            EXPECT_EQ(event["disk"], current) << event;
        }
    }
}

// Who reads along must be able to show each progress with its disk.
TEST_F(QueueTest, ProgressNamesTheImageItsStatusNames)
{
    const Events events(run({"verify", "--json", "a", "b", "c"}).output);
    ASSERT_GT(events.count("progress"), 0U);
    for (const auto& progress : events.named("progress")) {
        const std::string disk = progress["disk"];
        const std::string status = progress["status"];
        EXPECT_FALSE(disk.empty()) << progress;
        if (status.find("“") != std::string::npos) {
            EXPECT_NE(status.find("“" + disk + "”"), std::string::npos) << progress;
        }
    }
}

TEST_F(QueueTest, ABadImageKeepsNoOtherFromBeingChecked)
{
    const RunResult result = run({"verify", "--json", "a", "missing", "c"});
    EXPECT_EQ(result.status, 8);
    const std::vector<std::string> story{"finished missing failed", "started a", "finished a sound",
                                         "started c", "finished c sound"};
    EXPECT_EQ(Events(result.output).story({"started", "finished"}), story);
}

TEST_F(QueueTest, AnImageThatIsNamedTwiceIsSound)
{
    const RunResult result = run({"verify", "a", "a", path("a")});
    EXPECT_EQ(result.status, 0) << result.output << result.errors;
}

}  // namespace
}  // namespace orvane::test
