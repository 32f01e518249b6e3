// SPDX-License-Identifier: Apache-2.0
#include "tests/terminal/ProgramTest.h"

namespace orvane::test {
namespace {

using QueueTest = ProgramTest;

// Who reads along must be able to show each event with its disk.
TEST_F(QueueTest, EveryImageIsTreatedInItsTurnWhateverBecomesOfTheOthers)
{
    makeVolume("a");
    makeDamagedVolume("b");
    makeVolume("c");
    const RunResult result = run({"verify", "--details", "--json", "a", "missing", "b", "c"});
    EXPECT_EQ(result.status, 4 | 8);
    EXPECT_EQ(result.errors, "");
    const Events events(result.output);
    const std::vector<std::string> story{"finished missing failed",
                                         "started a",
                                         "finished a sound",
                                         "started b",
                                         "finished b damaged",
                                         "started c",
                                         "finished c sound",
                                         "report",
                                         "alert"};
    EXPECT_EQ(events.story({"started", "finished", "report", "alert"}), story);
    const std::string title = events.named("alert").front()["title"];
    EXPECT_NE(title.find("“b”"), std::string::npos) << title;

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
    ASSERT_FALSE(events.recordsWith("Root inode").empty());
    EXPECT_EQ(events.recordsWith("Root inode").front()["disk"], "b");

    ASSERT_GT(events.count("progress"), 0U);
    for (const auto& progress : events.named("progress")) {
        const std::string disk = progress["disk"];
        const std::string status = progress["status"];
        EXPECT_TRUE(status.find("“") == std::string::npos ||
                    status.find("“" + disk + "”") != std::string::npos)
            << progress;
    }
}

TEST_F(QueueTest, AnImageThatIsNamedTwiceIsSound)
{
    makeVolume("a");
    const RunResult result = run({"verify", "a", "a", path("a")});
    EXPECT_EQ(result.status, 0) << result.output << result.errors;
}

}  // namespace
}  // namespace orvane::test
