// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/QtLoop.h"

#include <gtest/gtest.h>

#include <QEventLoop>
#include <QTest>
#include <QTimer>

#include <atomic>
#include <thread>
#include <vector>

namespace orvane::desktop::test {
namespace {

using Wait = contract::RunLoop::Wait;

constexpr int longestWait = 30'000;  // milliseconds

TEST(QtLoop, TasksRunInTheOrderOfPostingOnTheMainThread)
{
    QtLoop loop;
    std::vector<int> ran;
    std::atomic<bool> hasWaited = false;
    std::jthread other([&] {
        for (int i = 0; i < 1000; ++i)
            loop.performOnMainThread(
                [&, i] {
                    EXPECT_TRUE(loop.isMainThread());
                    ran.push_back(i);
                },
                Wait::No);
        loop.performOnMainThread([&] { ran.push_back(1000); }, Wait::UntilDone);
        hasWaited = true;
    });
    ASSERT_TRUE(QTest::qWaitFor([&] { return hasWaited.load(); }, longestWait));
    ASSERT_EQ(ran.size(), 1001U);
    EXPECT_TRUE(std::is_sorted(ran.begin(), ran.end()));
}

// A tool may print faster than its lines can be shown.
TEST(QtLoop, AFloodOfTasksLeavesTheWindowItsTurn)
{
    QtLoop loop;
    bool hasStopped = false;
    std::function<void()> flood = [&] {
        if (!hasStopped)
            loop.post(flood);
    };
    loop.post(flood);
    QTimer::singleShot(0, [&] { hasStopped = true; });
    EXPECT_TRUE(QTest::qWaitFor([&] { return hasStopped; }, longestWait));
}

// A dialog that is opened by a task runs an event loop of its own.
TEST(QtLoop, ANestedEventLoopGoesOnWithTheTasksBehind)
{
    QtLoop loop;
    std::vector<std::string> ran;
    QEventLoop dialog;
    loop.post([&] {
        ran.emplace_back("dialog opens");
        dialog.exec();
        ran.emplace_back("dialog closed");
    });
    loop.post([&] {
        ran.emplace_back("task behind");
        dialog.quit();
    });
    ASSERT_TRUE(QTest::qWaitFor([&] { return ran.size() == 3; }, longestWait));
    EXPECT_EQ(ran, (std::vector<std::string>{"dialog opens", "task behind", "dialog closed"}));
}

}  // namespace
}  // namespace orvane::desktop::test
