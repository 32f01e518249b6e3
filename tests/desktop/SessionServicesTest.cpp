// SPDX-License-Identifier: Apache-2.0
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
        SessionOptions options;
        options.paths = {directory_ / "config", directory_ / "state", directory_ / "cache",
                         directory_ / "data"};
        options.disksToOpen = {image};
        options.scansSystemDisks = false;
        options.buses = {bus_.lookup("session"), bus_.lookup("system")};
        options.longestGlanceAway = std::chrono::milliseconds(0);
        session_ = std::make_unique<DesktopSession>(std::move(options));
        session_->show();
        ASSERT_TRUE(
            waitUntil([&] { return session_->host().sharedDiskController().roots().size() == 2; }));
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
    struct Case {
        const char* button;
        std::vector<QStringList> asked;
    };
    for (const Case& c : {Case{"verifyDiskButton", {}},
                          Case{"repairDiskButton",
                               {{QStringLiteral("sleep:shutdown:idle"), QStringLiteral("Orvane"),
                                 QStringLiteral("Repairing “a <b>”"), QStringLiteral("block")}}}}) {
        button(c.button).press();
        ASSERT_TRUE(waitUntil([&] { return logHolds("Pass 1") || logHolds("ing volume"); }));
        EXPECT_TRUE(waitUntil([&] { return logind_->held() == int(c.asked.size()); })) << c.button;
        EXPECT_EQ(logind_->asked, c.asked) << c.button;
        button(c.button).press();
        ASSERT_TRUE(waitForJob());
        EXPECT_TRUE(waitUntil([&] { return logind_->held() == 0; })) << c.button;
    }
}

TEST_F(SessionServicesTest, AJobThatNobodyWatchesIsAnnouncedAndAClickBringsTheWindow)
{
    openWithServices(makeDamagedImage("a <b>"));
    const auto verify = [this](bool isWatched) {
        if (isWatched)
            window().activateWindow();
        else
            window().hide();
        ASSERT_TRUE(waitUntil(
            [&] { return (QApplication::activeWindow() != nullptr) == isWatched; }));
        button("verifyDiskButton").press();
        ASSERT_TRUE(waitForJob());
        if (QMessageBox* const box = sheet())
            box->close();
    };
    verify(true);
    verify(false);
    ASSERT_TRUE(waitUntil([&] { return !notifications_->shown.empty(); }));
    ASSERT_EQ(notifications_->shown.size(), 1U) << "the first was watched";
    const auto& shown = notifications_->shown.front();
    EXPECT_EQ(shown.title, QStringLiteral("Verification of “a <b>”"));
    EXPECT_TRUE(shown.body.contains(QStringLiteral("a &lt;b&gt;"))) << qPrintable(shown.body);
    EXPECT_FALSE(shown.body.contains(QLatin1Char('<'))) << qPrintable(shown.body);

    window().showMinimized();
    EXPECT_TRUE(waitUntil([&] {
        emit notifications_->ActionInvoked(7, QStringLiteral("default"));
        return !window().isMinimized();
    }));
}

}  // namespace
}  // namespace orvane::desktop::test
