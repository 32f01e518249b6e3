// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/session/DesktopNotifier.h"
#include "orvane/desktop/session/SingleInstance.h"
#include "orvane/desktop/session/SleepInhibitor.h"
#include "tests/desktop/session/FakeServices.h"
#include "tests/desktop/session/PrivateBus.h"
#include "tests/support/TestDirectory.h"

#include <gtest/gtest.h>

#include <QDBusMessage>
#include <QTest>

#include <atomic>
#include <memory>
#include <thread>

namespace orvane::desktop::test {
namespace {

using namespace std::chrono_literals;

FinishedRun finished(const std::string& disk, const std::string& verdict,
                     const std::string& message = "",
                     pellar::Operation operation = pellar::Operation::Verify)
{
    return {{pellar::Subject::Filesystem, operation, disk}, {verdict, 0, message}};
}

TEST(JobNotice, OnlyALongJobThatNobodyWatchedIsNews)
{
    EXPECT_TRUE(isWorthANotice(11s, false));
    EXPECT_FALSE(isWorthANotice(11s, true)) << "the user has seen it";
    EXPECT_FALSE(isWorthANotice(9s, false)) << "the user has hardly looked away";
}

TEST(JobNotice, SaysWhatWasDoneOnWhatAndHowItWent)
{
    struct Case {
        std::vector<FinishedRun> runs;
        std::string title;
        std::string body;
        std::string_view because;
    };
    const auto sound = [](const char* disk) {
        return finished(disk, "sound", std::string(disk) + " is OK");
    };
    for (const Case& c :
         {Case{{finished("data", "repaired", "", pellar::Operation::Repair)},
               "Repair of “data”",
               "data: repaired",
               "a tool that says nothing more"},
          Case{{sound("a"), finished("b", "damaged", "b needs repair"), sound("c")},
               "Verification of 3 disks",
               "b needs repair\na is OK\nc is OK",
               "bad news first"},
          Case{{sound("a"), sound("b"), sound("c"), sound("d"), sound("e")},
               "Verification of 5 disks",
               "a is OK\nb is OK\nc is OK\nand 2 more",
               "more than a bubble holds"},
          Case{{finished("<b>&\n\x1b[1m\xff", "failed", "no <img src='x'> in it\n\a")},
               "Verification of “<b>&\uFFFD\uFFFD[1m\uFFFD”",
               "no &lt;img src='x'&gt; in it\uFFFD\uFFFD",
               "a hostile label is no markup, and the title is none anyway"}}) {
        const Notice notice = noticeOf(c.runs, Translator());
        EXPECT_EQ(notice.title, c.title) << c.because;
        EXPECT_EQ(notice.body, c.body) << c.because;
    }
}

class ServicesTest : public testing::Test {
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
    int clicks_ = 0;
};

TEST_F(ServicesTest, ANoticeArrivesAndItsClickComesBack)
{
    FakeNotifications server(bus_.connection("server"));
    DesktopNotifier notifier({bus_.lookup("program"), "org.orvane.Orvane", "Show", [this] {
                                  ++clicks_;
                              }});
    notifier.show({"Title", "Body"});
    ASSERT_TRUE(waitUntil([&] { return server.shown.size() == 1; }));
    const auto& shown = server.shown.front();
    EXPECT_EQ(shown.title + shown.body, QStringLiteral("TitleBody"));
    EXPECT_EQ(shown.actions.value(0), QStringLiteral("default"));

    // The next one tells that the number of the first has arrived.
    ASSERT_TRUE(waitUntil([&] {
        notifier.show({"Another", ""});
        return server.shown.back().replaced == 7;
    })) << "the old notice is out of date";
    emit server.ActionInvoked(8, QStringLiteral("default"));  // another program's
    emit server.ActionInvoked(7, QStringLiteral("settings"));
    emit server.ActionInvoked(7, QStringLiteral("default"));
    EXPECT_TRUE(waitUntil([&] { return clicks_ > 0; }));
    EXPECT_EQ(clicks_, 1) << "the others came before";
}

TEST_F(ServicesTest, AServerMayComeLaterOrNever)
{
    const auto options = [this](const BusLookup& bus) {
        return DesktopNotifier::Options{bus, "e", "Show", [this] {
                                            ++clicks_;
                                        }};
    };
    DesktopNotifier nowhere(options(SessionBuses().session));
    nowhere.show({"Title", "Body"});
    DesktopNotifier alone(options(bus_.lookup("program")));
    alone.show({"Title", "Body"});
    QTest::qWait(100);
    FakeNotifications late(bus_.connection("server"));
    alone.show({"Title", "Body"});
    EXPECT_TRUE(waitUntil([&] { return late.shown.size() == 1; }));
    EXPECT_EQ(late.shown.front().replaced, 0U);
    SleepInhibitor awake(bus_.lookup("program"));
    awake.hold("Repairing “a”");
    QTest::qWait(100);
    EXPECT_FALSE(awake.isHeld()) << "there is no logind";
}

TEST_F(ServicesTest, ALockThatComesTooLateIsGivenBackAtOnce)
{
    FakeLogind logind(bus_.connection("logind"));
    SleepInhibitor awake(bus_.lookup("program"));
    awake.hold("Repairing “a”");
    awake.release();
    EXPECT_TRUE(waitUntil([&] { return logind.asked.size() == 1 && logind.held() == 0; }));
    EXPECT_FALSE(awake.isHeld());
    awake.hold("Repairing “b”");
    EXPECT_TRUE(waitUntil([&] { return awake.isHeld(); }));
    awake.hold("Repairing “c”");
    EXPECT_TRUE(waitUntil([&] { return logind.asked.size() == 3 && logind.held() == 1; }))
        << "the next disk's takes the place of the first";
}

TEST_F(ServicesTest, TheSecondProgramHandsOverWhatItWasToOpen)
{
    int activations = 0;
    std::vector<std::string> opened;
    const auto first = std::make_unique<SingleInstance>(bus_.lookup("program"), "org.orvane.Test");
    EXPECT_FALSE(first->handOver({"/a"})) << "there is nobody else";
    first->setEvents({[&] { ++activations; },
                      [&](const std::vector<std::string>& names) {
                          opened.insert(opened.end(), names.begin(), names.end());
                      }});
    const orvane::test::TestDirectory directory;
    const std::string hostile = directory / "a %41\xff.img";
    directory.write("a %41\xff.img", "x");
    std::atomic<int> answer = -1;
    // It waits for the answer, which comes from this thread.
    const std::jthread second([&] {
        SingleInstance other(bus_.lookup("second"), "org.orvane.Test");
        answer = other.handOver({hostile, "LABEL=ä"}) ? 1 : 0;
    });
    ASSERT_TRUE(waitUntil([&] { return answer >= 0; }));
    EXPECT_EQ(answer, 1);
    EXPECT_EQ(opened, (std::vector<std::string>{hostile, "LABEL=ä"}));
    EXPECT_EQ(activations, 1);

    QDBusMessage open = QDBusMessage::createMethodCall(
        QStringLiteral("org.orvane.Test"), QStringLiteral("/org/orvane/Test"),
        QStringLiteral("org.freedesktop.Application"), QStringLiteral("Open"));
    open << QStringList{QStringLiteral("file:///b%20c"), QStringLiteral("http://d/")}
         << QVariantMap();
    bus_.connection("server").send(open);
    EXPECT_TRUE(waitUntil([&] { return opened.size() == 3; }));
    EXPECT_EQ(opened.back(), "/b c") << "as file managers ask for it; and nothing from elsewhere";
    SingleInstance nowhere(SessionBuses().session, "org.orvane.Test");
    EXPECT_FALSE(nowhere.handOver({}));
}

}  // namespace
}  // namespace orvane::desktop::test
