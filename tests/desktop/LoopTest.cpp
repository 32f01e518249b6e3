// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/QtLoop.h"
#include "orvane/desktop/ScheduledChecks.h"
#include "tests/support/BusObject.h"
#include "tests/support/TestDirectory.h"

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

TEST(ScheduledChecks, WhatOthersPublishAppearsByItself)
{
    const orvane::test::SystemBus none("unix:path=/nonexistent/bus");
    const orvane::test::TestDirectory directory;
    const orvane::Run::Time time{std::chrono::system_clock::now()};
    const orvane::Run sound{"verify", time, time, RunEnd{"sound", 0, ""}};
    const auto publish = [&](const char* verdict) {
        orvane::Run run = sound;
        run.end->verdict = verdict;
        EXPECT_TRUE(publishCheck(directory.path(), "k", {"/dev/a", "", run, {}}));
    };
    QtLoop loop;
    int changes = 0;
    ScheduledChecks checks(
        loop, [&] { ++changes; }, directory.path());
    publish("sound");
    EXPECT_EQ(checks.lastRun("k"), nullptr) << "before the start";
    checks.start();
    ASSERT_NE(checks.lastRun("k"), nullptr);
    EXPECT_EQ(changes, 1);
    publish("damaged");
    ASSERT_TRUE(QTest::qWaitFor([&] { return changes == 2; }, longestWait));
    EXPECT_EQ(checks.lastRun("k")->verdict(), "damaged");
}

}  // namespace
}  // namespace orvane::desktop::test
