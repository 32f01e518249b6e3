// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/settings/Switch.h"
#include "tests/desktop/WindowFixture.h"
#include "tests/desktop/session/FakeServices.h"
#include "tests/desktop/session/PrivateBus.h"

#include <QApplication>

namespace orvane::desktop::test {
namespace {

/// The window with a notification server and a logind that are the test's own.
class SessionServicesTest : public WindowFixture {
protected:
    void SetUp() override
    {
        if (!bus_.isRunning())
            GTEST_SKIP() << "there is no dbus-daemon";
        notifications_ = std::make_unique<FakeNotifications>(bus_.connection("notifications"));
        logind_ = std::make_unique<FakeLogind>(bus_.connection("logind"));
    }

    void openWithServices(const std::string& image)
    {
        SessionOptions wanted = options({image});
        wanted.buses = {bus_.lookup("session"), bus_.lookup("system")};
        wanted.longestGlanceAway = std::chrono::milliseconds(0);
        openWith(std::move(wanted));
        ASSERT_TRUE(waitUntil([&] { return !cell(image, DiskColumn::Name).empty(); }));
        select(image);
    }

    PrivateBus bus_;
    std::unique_ptr<FakeNotifications> notifications_;
    std::unique_ptr<FakeLogind> logind_;
};

TEST_F(SessionServicesTest, OnlyARepairKeepsTheMachineAwakeAndOnlyUntilItsEnd)
{
    useEndlessTool();
    openWithServices(makeImage("a <b>"));
    for (const char* const name : {"verifyDiskButton", "repairDiskButton"}) {
        const bool isRepair = name == std::string_view("repairDiskButton");
        button(name).press();
        ASSERT_TRUE(waitUntil([&] { return logHolds("Pass 1") || logHolds("ing volume"); }));
        EXPECT_TRUE(waitUntil([&] { return logind_->held() == (isRepair ? 1 : 0); })) << name;
        EXPECT_EQ(logind_->asked.size(), isRepair ? 1U : 0U) << name;
        button(name).press();
        ASSERT_TRUE(waitForJob());
        EXPECT_TRUE(waitUntil([&] { return logind_->held() == 0; })) << name;
    }
    EXPECT_EQ(logind_->asked.front().value(0), QStringLiteral("sleep:shutdown:idle"));
    EXPECT_EQ(logind_->asked.front().value(3), QStringLiteral("block"));
}

TEST_F(SessionServicesTest, AJobThatNobodyWatchesIsAnnouncedAndAClickBringsTheWindow)
{
    openWithServices(makeDamagedImage("a <b>"));
    const auto verify = [this](bool isWatched, const char* name = "verifyDiskButton") {
        if (isWatched)
            window().activateWindow();
        else
            window().hide();
        ASSERT_TRUE(
            waitUntil([&] { return (QApplication::activeWindow() != nullptr) == isWatched; }));
        button(name).press();
        ASSERT_TRUE(waitForJob());
        takeSheet();
    };
    verify(true);
    showsNotices.set(session().host().standardUserDefaults(), false);
    verify(false);
    window().show();
    showsNotices.set(session().host().standardUserDefaults(), true);
    verify(false, "repairDiskButton");
    ASSERT_TRUE(waitUntil([&] { return !notifications_->shown.empty(); }));
    ASSERT_EQ(notifications_->shown.size(), 1U) << "one was watched, one not wanted";
    EXPECT_EQ(notifications_->shown.front().title, QStringLiteral("Repair of “a <b>”"));
    window().showMinimized();
    EXPECT_TRUE(waitUntil([&] {
        emit notifications_->ActionInvoked(7, QStringLiteral("default"));
        return !window().isMinimized();
    }));
}

}  // namespace
}  // namespace orvane::desktop::test
