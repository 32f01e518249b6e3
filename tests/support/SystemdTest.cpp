// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/systemd/CheckTimers.h"
#include "orvane/support/systemd/Journal.h"
#include "pellar/process/FileDescriptor.h"
#include "tests/support/BusDaemon.h"
#include "tests/support/BusObject.h"
#include "tests/support/TestDirectory.h"

#include <gtest/gtest.h>

#include <sys/socket.h>
#include <sys/un.h>

#include <atomic>
#include <cstring>
#include <limits>
#include <map>

namespace orvane {
namespace {

using test::BusDaemon;
using test::SystemBus;
using Time = std::chrono::system_clock::time_point;
using std::chrono::microseconds;

/// The fields of a record, as the journal would read them.
std::vector<std::pair<std::string, std::string>> fieldsIn(std::string_view text)
{
    std::vector<std::pair<std::string, std::string>> fields;
    while (!text.empty()) {
        const std::size_t end = text.find_first_of("=\n");
        const std::string name(text.substr(0, end));
        std::size_t length = text.find('\n', end) - end - 1;
        text.remove_prefix(end + 1);
        if (text.data()[-1] == '\n') {
            length = 0;
            for (int i = 7; i >= 0; --i)
                length =
                    length << 8U | static_cast<unsigned char>(text[static_cast<std::size_t>(i)]);
            text.remove_prefix(8);
        }
        fields.emplace_back(name, text.substr(0, length));
        text.remove_prefix(length + 1);
    }
    return fields;
}

TEST(Journal, NoValueBecomesAFieldOfItsOwn)
{
    const test::TestDirectory directory;
    const pellar::FileDescriptor journal(::socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0));
    const auto path = directory / "socket";
    EXPECT_FALSE(writeToJournal({{"MESSAGE", "a"}}, path)) << "there is none";
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    std::strncpy(address.sun_path, path.c_str(), sizeof address.sun_path - 1);
    ASSERT_EQ(::bind(journal.get(), reinterpret_cast<sockaddr*>(&address), sizeof address), 0);

    const std::string hostile("x\nPRIORITY=0\n\xff\0", 15);
    ASSERT_TRUE(writeToJournal({{"MESSAGE", "a=b"},
                                {"FIXWELL_LABEL", hostile},
                                {"EMPTY", ""},
                                {"LONG", std::string(1 << 20, '\n')}},
                               path));
    std::string text(1 << 20, '\0');
    text.resize(static_cast<std::size_t>(::recv(journal.get(), text.data(), text.size(), 0)));
    const auto fields = fieldsIn(text);
    ASSERT_EQ(fields.size(), 4U);
    EXPECT_EQ(fields[0], std::pair(std::string("MESSAGE"), std::string("a=b")));
    EXPECT_EQ(fields[1], std::pair(std::string("FIXWELL_LABEL"), hostile));
    EXPECT_EQ(fields[2], std::pair(std::string("EMPTY"), std::string()));
    EXPECT_EQ(fields[3].second.size(), 16384U);

    // Nobody reads: the journal hangs, and the program does not.
    int taken = 0;
    while (writeToJournal({{"MESSAGE", "a"}}, path))
        ASSERT_LT(++taken, 10000);
}

TEST(CheckTimers, AnInstanceStandsForADisk)
{
    struct Case {
        std::string_view instance, name, because;
    };
    for (const Case& c :
         {Case{"all", "all", "no escape"}, Case{"dev-sdb1", "/dev/sdb1", "systemd-escape --path"},
          Case{"-dev-sdb1", "/dev/sdb1", "systemd-escape"},
          Case{R"(dev-mapper-a\x2db)", "/dev/mapper/a-b", "a dash of its own"},
          Case{R"(LABEL\x3dMy\x20$HOME)", "LABEL=My $HOME", "blanks"},
          Case{R"(a\x5c\xZZ\x4)", R"(a\\xZZ\x4)", "what is no escape stays"}})
        EXPECT_EQ(nameOfInstance(c.instance), c.name) << c.because;
}

std::shared_ptr<Disk> volume(const std::string& path, const std::string& mountPoint = {})
{
    DiskFacts facts;
    facts.identifier = path;
    facts.path = path;
    facts.label = "Photos";
    facts.uuid = "1234";
    facts.filesystem = "btrfs";
    facts.mountPoint = mountPoint;
    facts.type = diskType::volume;
    facts.storage = contract::DiskReference::Storage::BlockDevice;
    return std::make_shared<Disk>(
        facts, Disk::Surroundings{[](std::string_view type) {
                                      return FilesystemCapabilities{
                                          type == "btrfs" || type == "ext4", true, type == "btrfs"};
                                  },
                                  nullptr});
}

TEST(CheckTimers, TheFirstOfThoseThatAreAboutADiskIsItsNext)
{
    const Time monday(std::chrono::hours(96)), sunday(std::chrono::hours(72));
    struct Case {
        std::vector<CheckTimer> timers;
        std::optional<Time> next;
        std::string_view because;
    };
    for (const Case& c : {Case{{}, std::nullopt, "no timers"},
                          Case{{{"/dev/sdc1", sunday}}, std::nullopt, "another"},
                          Case{{{"/dev/sdb1", sunday}}, sunday, "by its path"},
                          Case{{{"LABEL=Photos", sunday}}, sunday, "by its label"},
                          Case{{{"LABEL=", sunday}}, std::nullopt, "of no label"},
                          Case{{{"UUID=1234", monday}, {"all", sunday}}, sunday, "the sooner one"}})
        EXPECT_EQ(nextCheckOf(*volume("/dev/sdb1"), c.timers), c.next) << c.because;

    auto facts = volume("/dev/sdb1", "/mnt")->facts();
    const std::vector<CheckTimer> timers{{"all", sunday}};
    const auto with = [&](const char* filesystem) {
        const auto disk = volume("/dev/sdb1", "/mnt");
        facts.filesystem = filesystem;
        disk->setFacts(facts);
        return nextCheckOf(*disk, timers);
    };
    EXPECT_EQ(with("btrfs"), sunday) << "is verified where it is mounted";
    EXPECT_FALSE(with("ext4")) << "would be skipped";
    facts.mountPoint.clear();
    EXPECT_EQ(with("ext4"), sunday);
    EXPECT_FALSE(with("swap")) << "nothing verifies it";
}

using Unit =
    sdbus::Struct<std::string, std::string, std::string, std::string, std::string, std::string,
                  sdbus::ObjectPath, std::uint32_t, std::string, sdbus::ObjectPath>;

/// A service manager with timers, by their units; each says when it is due.
class FakeManager {
public:
    FakeManager(const std::string& address, const std::map<std::string, std::uint64_t>& timers)
        : connection_(sdbus::createSessionBusConnectionWithAddress(address))
    {
        const std::string top = "/org/freedesktop/systemd1";
        for (const auto& [name, next] : timers) {
            const sdbus::ObjectPath path(top + "/unit/u" + std::to_string(units_.size()));
            units_.push_back({name, "", "loaded", "active", "waiting", "", path, 0U, "",
                              sdbus::ObjectPath("/")});
            objects_.push_back(sdbus::createObject(*connection_, path));
            test::addProperties(*objects_.back(), "org.freedesktop.systemd1.Timer",
                                std::pair{"NextElapseUSecRealtime", test::always(next)});
            test::finish(*objects_.back());
        }
        objects_.push_back(sdbus::createObject(*connection_, sdbus::ObjectPath(top)));
        test::addMethod(
            *objects_.back(), "org.freedesktop.systemd1.Manager", "ListUnitsByPatterns",
            [this](sdbus::Result<std::vector<Unit>>&& result,
                   const std::vector<std::string>& /*states*/,
                   const std::vector<std::string>& patterns) {
                if (answers && patterns == std::vector<std::string>{"fixwell-check@*.timer"})
                    result.returnResults(units_);
                else
                    unanswered_.push_back(std::move(result));
            });
        test::finish(*objects_.back());
        connection_->requestName(BusServiceName("org.freedesktop.systemd1"));
        connection_->enterEventLoopAsync();
    }
    ~FakeManager() { connection_->leaveEventLoop(); }

    std::atomic<bool> answers = true;

private:
    std::unique_ptr<sdbus::IConnection> connection_;
    std::vector<Unit> units_;
    std::vector<sdbus::Result<std::vector<Unit>>> unanswered_;
    std::vector<std::unique_ptr<sdbus::IObject>> objects_;
};

TEST(CheckTimers, AreThoseOfTheManagerWhereThereIsOneThatAnswers)
{
    const BusDaemon bus;
    if (!bus.isRunning())
        GTEST_SKIP() << "no bus can be started (package dbus-daemon)";
    const SystemBus address(bus.address());
    EXPECT_TRUE(readCheckTimers().empty()) << "there is no manager";
    FakeManager manager(bus.address(),
                        {{"fixwell-check@all.timer", 5'000'000},
                         {"fixwell-check@dev-sdb1.timer", 7},
                         {"fixwell-check@off.timer", 0},
                         {"fixwell-check@never.timer", std::numeric_limits<std::uint64_t>::max()},
                         {"other.timer", 9}});
    EXPECT_EQ(readCheckTimers(), (std::vector<CheckTimer>{{"all", Time(microseconds(5'000'000))},
                                                          {"/dev/sdb1", Time(microseconds(7))}}));
    manager.answers = false;
    EXPECT_TRUE(readCheckTimers().empty()) << "it came back";
}

}  // namespace
}  // namespace orvane
