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
    const RunResult result = run({"verify", "--details", "--json", "a", "missing", "b", "c", "a"});
    EXPECT_EQ(result.status, 4 | 8);
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

    ASSERT_FALSE(events.recordsWith("Root inode").empty());
    EXPECT_EQ(events.recordsWith("Root inode").front()["disk"], "b");
}

}  // namespace
}  // namespace orvane::test
