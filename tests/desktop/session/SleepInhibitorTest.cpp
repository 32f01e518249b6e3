// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/session/SleepInhibitor.h"
#include "tests/desktop/session/FakeServices.h"
#include "tests/desktop/session/PrivateBus.h"

#include <gtest/gtest.h>

#include <QTest>

namespace orvane::desktop::test {
namespace {

class SleepInhibitorTest : public testing::Test {
protected:
    void SetUp() override
    {
        if (!bus_.isRunning())
            GTEST_SKIP() << "there is no dbus-daemon";
    }

    static bool waitUntil(const std::function<bool()>& isDone)
    {
        return QTest::qWaitFor(isDone, 20'000);
    }

    PrivateBus bus_;
};

TEST_F(SleepInhibitorTest, TheLockLastsUntilItIsGivenBack)
{
    FakeLogind logind(bus_.connection("logind"));
    SleepInhibitor wakefulness(bus_.lookup("program"));
    wakefulness.hold("Repairing “a”");
    EXPECT_TRUE(waitUntil([&] { return wakefulness.isHeld(); }));
    ASSERT_EQ(logind.asked.size(), 1U);
    EXPECT_EQ(logind.asked.front(),
              (QStringList{QStringLiteral("sleep:shutdown:idle"), QStringLiteral("Orvane"),
                           QStringLiteral("Repairing “a”"), QStringLiteral("block")}));
    EXPECT_EQ(logind.held(), 1);

    wakefulness.hold("Repairing “b”");
    EXPECT_TRUE(waitUntil([&] { return logind.asked.size() == 2 && logind.held() == 1; }))
        << "the next disk's takes the place of the first";
    EXPECT_TRUE(wakefulness.isHeld());
    wakefulness.release();
    EXPECT_TRUE(waitUntil([&] { return logind.held() == 0; }));
}

TEST_F(SleepInhibitorTest, ALockThatComesTooLateIsGivenBackAtOnce)
{
    FakeLogind logind(bus_.connection("logind"));
    SleepInhibitor wakefulness(bus_.lookup("program"));
    wakefulness.hold("Repairing “a”");
    wakefulness.release();
    EXPECT_TRUE(waitUntil([&] { return logind.asked.size() == 1 && logind.held() == 0; }));
    EXPECT_FALSE(wakefulness.isHeld());
    {
        SleepInhibitor shortLived(bus_.lookup("program"));
        shortLived.hold("Repairing “b”");
    }
    EXPECT_TRUE(waitUntil([&] { return logind.asked.size() == 2 && logind.held() == 0; }));
}

TEST_F(SleepInhibitorTest, WithoutLogindThereIsNoLock)
{
    SleepInhibitor wakefulness(bus_.lookup("program"));
    wakefulness.hold("Repairing “a”");
    QTest::qWait(100);
    EXPECT_FALSE(wakefulness.isHeld());
    SleepInhibitor nowhere(SessionBuses().system);
    nowhere.hold("Repairing “a”");
    EXPECT_FALSE(nowhere.isHeld());
}

}  // namespace
}  // namespace orvane::desktop::test
