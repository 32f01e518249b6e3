// SPDX-License-Identifier: Apache-2.0
#include "contract/pellar/ErrorCodes.h"
#include "orvane/jobs/JobLedger.h"
#include "orvane/jobs/PublishedChecks.h"
#include "orvane/terminal/CheckResult.h"
#include "tests/support/BusDaemon.h"
#include "tests/support/BusObject.h"
#include "tests/support/LoopDevice.h"
#include "tests/terminal/ProgramTest.h"

#include <sys/mount.h>
#include <sys/stat.h>

#include <atomic>
#include <thread>

namespace orvane {
namespace {

using Time = Run::Time;
using std::chrono::hours;
using test::Events;
using test::TestDirectory;

Time daysAgo(int days)
{
    return std::chrono::floor<std::chrono::milliseconds>(std::chrono::system_clock::now() -
                                                         hours(24 * days));
}

PublishedCheck check(const std::string& device, Time started, const char* verdict)
{
    return {
        device, "u", Run{"verify", started, started + hours(1), RunEnd{verdict, 0, "", "", 3}}, {}};
}

TEST(PublishedChecks, AreKeptByVolumeUntilNewerOnesCome)
{
    const TestDirectory directory;
    const auto place = directory / "checks";
    EXPECT_TRUE(readPublishedChecks(place).empty());
    const auto first = check("/dev/a\xff\n", daysAgo(9), "damaged");
    ASSERT_TRUE(publishCheck(place, "a", first));
    ASSERT_TRUE(publishCheck(place, "old", check("/dev/old", daysAgo(400), "damaged")));
    const Time eight = daysAgo(8);
    PublishedCheck sound = check("/dev/b", eight, "sound");
    sound.uuid = "v";
    ASSERT_TRUE(publishCheck(place, "b", sound));
    const PublishedChecks copies{{"uuid:u", first},
                                 {"uuid:u@/dev/b", check("/dev/b", eight, "sound")}};
    EXPECT_EQ(publishedRun(copies, "uuid:u"), nullptr) << "of which of the two is it?";
    PublishedCheck skipped{"/dev/a\xff\n", "u", {}, daysAgo(1)};
    ASSERT_TRUE(publishCheck(place, "a", skipped));
    skipped.run = first.run;
    const auto all = readPublishedChecks(place);
    EXPECT_EQ(all.size(), 2U) << "what is older than a year is forgotten";
    EXPECT_EQ(all.at("a"), skipped) << "what was found is not lost by being skipped";
    ASSERT_NE(publishedRun(all, "b"), nullptr);
    EXPECT_EQ(publishedRun(all, "b")->started, eight);
    EXPECT_EQ(publishedRun(all, "c"), nullptr);

    const PublishedChecks other{{"a", check("/dev/a", daysAgo(5), "sound")},
                                {"b", check("/dev/b", daysAgo(2), "damaged")}};
    const auto newest = newestOf(all, other);
    EXPECT_EQ(newest.at("a"), skipped);
    EXPECT_EQ(newest.at("b"), other.at("b"));
}

TEST(PublishedChecks, SeveralProgramsLoseNothing)
{
    const TestDirectory directory;
    const auto place = directory / "checks";
    std::vector<std::jthread> programs;
    for (int program = 0; program < 4; ++program)
        programs.emplace_back([&, program] {
            for (int i = 0; i < 8; ++i)
                EXPECT_TRUE(publishCheck(place, std::to_string(program * 8 + i),
                                         check("/dev/a", daysAgo(1), "sound")));
        });
    programs.clear();
    EXPECT_EQ(readPublishedChecks(place).size(), 32U);
    struct stat status = {};
    ASSERT_EQ(::stat((place / "last.json").c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 0777U, 0644U);
    EXPECT_EQ(std::distance(std::filesystem::directory_iterator(place), {}), 2) << "and the lock";
}

TEST(PublishedChecks, NothingIsBelievedThatOthersCouldHaveWritten)
{
    const TestDirectory directory;
    const auto place = directory / "checks";
    const auto file = place / "last.json";
    ASSERT_TRUE(publishCheck(place, "a", check("/dev/a", daysAgo(1), "sound")));
    ::chmod(file.c_str(), 0666);
    EXPECT_TRUE(readPublishedChecks(place).empty());
    ::chmod(file.c_str(), 0644);
    ::chmod(place.c_str(), 0777);
    EXPECT_TRUE(readPublishedChecks(place).empty());
    ::chmod(place.c_str(), 0755);
    EXPECT_EQ(readPublishedChecks(place).size(), 1U);
    for (const std::string& text :
         {std::string("{\"a\":{\"verdict\":\"excellent\",\"started\":1}}"), std::string("[[["),
          std::string(), std::string("{\"a\":7}"),
          std::string("{\"a\":{\"verdict\":\"sound\",\"started\":-1}}"),
          std::string("{\"a\":{\"verdict\":\"sound\",\"started\":1e300}}"),
          std::string("{\"a\":{\"verdict\":\"sound\",\"started\":9223372036854775807}}")}) {
        test::write(file, text);
        EXPECT_EQ(publishedRun(readPublishedChecks(place), "a"), nullptr) << text;
    }
    std::filesystem::remove(file);
    test::write(directory / "elsewhere", "{\"a\":{\"verdict\":\"sound\",\"started\":1}}");
    std::filesystem::create_symlink(directory / "elsewhere", file);
    EXPECT_TRUE(readPublishedChecks(place).empty()) << "a link";
}

TEST(LastRuns, ARunThatOnlyOthersKeepIsOneOfThem)
{
    HistoryStore store({}, {}, [](const std::string&) {});
    const orvane::Run others = *check("", daysAgo(3), "damaged").run;
    EXPECT_FALSE(lastRunsOf(store, "k", nullptr));
    EXPECT_EQ(lastRunsOf(store, "k", &others)->told.verdict(), "damaged");
    const auto own = [&](int days, const char* verdict) {
        store.endRun(store.beginRun("k", "verify", daysAgo(days)), {verdict, 0, ""}, daysAgo(days));
    };
    own(5, "sound");
    EXPECT_EQ(lastRunsOf(store, "k", &others)->told.verdict(), "damaged");
    own(2, "stopped");
    EXPECT_EQ(lastRunsOf(store, "k", &others)->told.verdict(), "damaged");
    EXPECT_EQ(lastRunsOf(store, "k", &others)->later->verdict(), "stopped");
    own(1, "repaired");
    EXPECT_EQ(lastRunsOf(store, "k", &others)->told.verdict(), "repaired");
    EXPECT_FALSE(lastRunsOf(store, "k", &others)->later);
}

TEST(CheckResult, IsARecordThatLooksAsSeriousAsItIs)
{
    struct Case {
        const char *verdict, *skipped, *priority, *told;
    };
    for (const Case& c : {Case{"sound", "", "6", "sound"}, Case{"damaged", "", "3", "damaged"},
                          Case{"failed", "", "4", "failed"}, Case{"", "in use", "5", "skipped"}}) {
        CheckResult result{"disk", {}, *check("", Time(), c.verdict).run, c.skipped};
        result.facts.label = "a\nb";
        std::map<std::string, std::string, std::less<>> fields;
        for (const JournalField& field : journalFieldsOf(result, "a\x1b[2J\nb"))
            EXPECT_TRUE(fields.emplace(field.name, field.value).second) << field.name;
        EXPECT_EQ(fields["PRIORITY"], c.priority) << c.told;
        EXPECT_EQ(fields["FIXWELL_VERDICT"], c.told);
        EXPECT_EQ(fields["FIXWELL_LABEL"], "a\nb") << "as it stands on the disk";
        EXPECT_FALSE(test::holdsControls(fields["MESSAGE"]));
        EXPECT_EQ(fields.contains("FIXWELL_PROBLEMS"), *c.skipped == '\0') << "nothing was counted";
        EXPECT_EQ(fields["MESSAGE_ID"].size(), 32U);
    }
}

using ScheduledCheckTest = test::ProgramTest;

TEST_F(ScheduledCheckTest, DamageFailsAndEveryResultIsPublished)
{
    makeVolume("good");
    makeDamagedVolume("bad");
    const auto both = run({"scheduled-check", "--json", "good", "bad"});
    EXPECT_EQ(both.status, 4) << both.errors;
    EXPECT_EQ(Events(both.output).count("done"), 2U);
    EXPECT_EQ(run({"scheduled-check", "good"}).status, 0);
    EXPECT_EQ(run({"scheduled-check", R"(--instance=)" + std::string("good")}).status, 0);
    EXPECT_EQ(run({"scheduled-check", "--instance=nowhere"}).status, 8)
        << "a disk that died is no skip";
    const std::string metrics = run({"metrics", "good", "bad"}).output;
    EXPECT_EQ(test::countOf("verdict=\"damaged\"} 1", metrics), 1U) << metrics;
    EXPECT_EQ(test::countOf("verdict=\"sound\"} 1", metrics), 1U) << metrics;
}

TEST_F(ScheduledCheckTest, WhatIsMountedIsLeftAloneAndIsNoFailure)
{
    if (const char* const obstacle = test::LoopDevice::obstacle())
        GTEST_SKIP() << obstacle;
    environment_["DBUS_SYSTEM_BUS_ADDRESS"] = "unix:path=/nonexistent/bus";
    const test::LoopDevice device(makeVolume("image"));
    std::filesystem::create_directory(path("place"));
    ASSERT_EQ(::mount(device.name().c_str(), path("place").c_str(), "ext4", 0, nullptr), 0);
    const auto skipped = run({"scheduled-check", "--json", device.name()});
    EXPECT_EQ(skipped.status, 0) << skipped.errors;
    const auto done = Events(skipped.output).named("done");
    EXPECT_EQ(done.size(), 1U);
    EXPECT_NE(done.at(0)["message"].get<std::string>().find(path("place").native()),
              std::string::npos);
    EXPECT_EQ(Events(skipped.output).count("started"), 0U);
    EXPECT_EQ(::umount2(path("place").c_str(), 0), 0) << "it is still mounted";
    EXPECT_EQ(test::countOf("fixwell_last_skipped_timestamp_seconds{",
                            run({"metrics", device.name()}).output),
              1U);

    // Others have it, which shows only as it is opened.
    {
        const pellar::FileDescriptor holder(
            ::open(device.name().c_str(), O_RDWR | O_EXCL | O_CLOEXEC));
        const auto held = run({"scheduled-check", "--json", device.name()});
        EXPECT_EQ(held.status, 0) << held.output << held.errors;
        EXPECT_EQ(Events(held.output).named("done").at(0)["action"], "skip");
    }
    EXPECT_EQ(run({"scheduled-check", device.name()}).status, 0);
    EXPECT_EQ(test::countOf("fixwell_last_skipped", run({"metrics", device.name()}).output), 0U);
}

/// A desktop's notification server, which keeps what it was told.
class FakeNotifications {
public:
    explicit FakeNotifications(const std::string& address)
        : connection_(sdbus::createSessionBusConnectionWithAddress(address)),
          object_(sdbus::createObject(*connection_,
                                      sdbus::ObjectPath("/org/freedesktop/Notifications")))
    {
        test::addMethod(
            *object_, "org.freedesktop.Notifications", "Notify",
            [this](const std::string&, std::uint32_t, const std::string&, const std::string&,
                   const std::string& body, const std::vector<std::string>&,
                   const std::map<std::string, sdbus::Variant>&, std::int32_t) {
                body_ = body;
                return std::uint32_t(++count);
            });
        test::finish(*object_);
        connection_->requestName(BusServiceName("org.freedesktop.Notifications"));
        connection_->enterEventLoopAsync();
    }
    ~FakeNotifications() { connection_->leaveEventLoop(); }

    std::string body()
    {
        connection_->leaveEventLoop();
        return body_;
    }
    std::atomic<unsigned int> count = 0;

private:
    std::string body_;
    std::unique_ptr<sdbus::IConnection> connection_;
    std::unique_ptr<sdbus::IObject> object_;
};

TEST_F(ScheduledCheckTest, TheDesktopIsToldOnceOfWhatIsBad)
{
    const test::BusDaemon bus;
    if (!bus.isRunning())
        GTEST_SKIP() << "no bus can be started (package dbus-daemon)";
    environment_["DBUS_SESSION_BUS_ADDRESS"] = bus.address();
    makeVolume("good");
    makeDamagedVolume("<b>bad");
    static_cast<void>(run({"scheduled-check", "good"}));
    EXPECT_EQ(run({"notify"}).status, 0) << "nothing is bad, and no server is asked for";
    static_cast<void>(run({"scheduled-check", "<b>bad"}));
    EXPECT_EQ(run({"notify"}).status, 8) << "there is no server";
    FakeNotifications desktop(bus.address());
    EXPECT_EQ(run({"notify"}).status, 0);
    EXPECT_EQ(run({"notify"}).status, 0);
    EXPECT_EQ(desktop.count, 1U) << "what no server took is told again, what one took is not";
    const std::string body = desktop.body();
    EXPECT_NE(body.find("&lt;b&gt;bad: damaged"), std::string::npos) << body;
    EXPECT_EQ(body.find("good"), std::string::npos) << body;
}

}  // namespace
}  // namespace orvane
