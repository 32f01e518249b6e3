// SPDX-License-Identifier: Apache-2.0
#include "pellar/process/Stopping.h"
#include "pellar/process/ProcessOutput.h"

#include <gtest/gtest.h>

#include <csignal>

namespace {

using namespace std::chrono_literals;
using namespace pellar;
const Clock::time_point start{};

TEST(StopLadder, PressesHarderAsTimePasses)
{
    StopLadder ladder({2s, 3s, 0s});
    EXPECT_EQ(ladder.due(start + 1h), 0) << "nobody wants it to end";
    EXPECT_EQ(ladder.press(start), SIGINT);
    EXPECT_EQ(ladder.due(start + 1999ms), 0);
    EXPECT_EQ(ladder.due(start + 2s), SIGTERM);
    EXPECT_EQ(ladder.due(start + 4999ms), 0);
    EXPECT_EQ(ladder.due(start + 5s), SIGKILL);
    EXPECT_FALSE(ladder.deadline());
    EXPECT_EQ(ladder.press(start + 6s), 0) << "there is nothing harder";
}

TEST(StopLadder, EachPressIsTheNextStepAtOnce)
{
    StopLadder ladder(graceTimesFor(Access::ReadWrite));
    EXPECT_EQ(ladder.press(start), SIGINT);
    EXPECT_EQ(ladder.press(start), SIGTERM);
    EXPECT_EQ(ladder.press(start), SIGKILL);
}

TEST(StopLadder, LeavingKillsAReaderAndGivesAWriterAMoment)
{
    EXPECT_EQ(StopLadder(graceTimesFor(Access::ReadOnly)).pressHard(start), SIGKILL);
    StopLadder writer(graceTimesFor(Access::ReadWrite));
    EXPECT_EQ(writer.pressHard(start), SIGINT);
    EXPECT_EQ(writer.pressHard(start + 1s), 0) << "once is enough";
    EXPECT_EQ(writer.due(start + 3s), SIGKILL);
}

TEST(OutputBudget, VerifyIsEndedWhereRepairGoesOnUnheard)
{
    struct Case {
        Access access;
        int lines;
        OutputBudget::State state;
    };
    for (const Case& c : {Case{Access::ReadOnly, 10, OutputBudget::State::Heard},
                          Case{Access::ReadOnly, 11, OutputBudget::State::Spent},
                          Case{Access::ReadWrite, 11, OutputBudget::State::Unheard},
                          Case{Access::ReadWrite, 99, OutputBudget::State::Unheard},
                          Case{Access::ReadWrite, 100, OutputBudget::State::Spent}}) {
        OutputBudget budget({10, 1000}, c.access);
        for (int i = 0; i < c.lines; ++i)
            budget.countLine();
        EXPECT_EQ(budget.state(), c.state) << c.lines << " lines";
    }
}

}  // namespace
