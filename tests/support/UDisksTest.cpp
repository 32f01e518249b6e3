// SPDX-License-Identifier: Apache-2.0
#include "TemporaryDirectory.h"
#include "ToolRun.h"
#include "orvane/support/loop/MainLoop.h"
#include "orvane/support/udisks/BusCall.h"
#include "orvane/support/udisks/DiskOperations.h"
#include "orvane/support/udisks/DiskReader.h"
#include "orvane/support/udisks/ImageDevices.h"
#include "orvane/support/udisks/MountedAt.h"
#include "orvane/support/udisks/UDisks.h"
#include "pellar/disks/DiskClaim.h"
#include "tests/support/BusDaemon.h"
#include "tests/support/LoopDevice.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <atomic>
#include <fstream>
#include <map>

namespace orvane {
namespace {

using Kind = Refusal::Kind;
using pellar::Access;
using test::LoopDevice;
using test::TemporaryDirectory;
using namespace std::chrono_literals;

/// A variable of the environment, put back at the end.
class Setting {
public:
    Setting(const char* name, const std::string& value) : name_(name)
    {
        const char* const old = std::getenv(name);
        if (old != nullptr)
            old_ = old;
        ::setenv(name, value.c_str(), 1);
    }
    Setting(const Setting&) = delete;
    Setting& operator=(const Setting&) = delete;
    ~Setting() { old_ ? ::setenv(name_, old_->c_str(), 1) : ::unsetenv(name_); }

private:
    const char* name_;
    std::optional<std::string> old_;
};

template <class T>
Kind kindOf(const Answer<T>& answer)
{
    return std::get<Refusal>(answer).kind;
}

DiskRequest request(DiskAction action, DiskStep::Kind kind, const std::string& node)
{
    return {action, node, node, {{kind, node}}};
}

/// A loop device with a file system, and a thread behind the loop's back that works on it.
class DeviceTest : public testing::Test {
protected:
    void SetUp() override
    {
        if (const char* const obstacle = LoopDevice::obstacle())
            GTEST_SKIP() << obstacle;
        const std::string image = directory_ / "volume.img";
        ASSERT_EQ(test::runTool({"mke2fs", "-q", "-F", "-t", "ext4", image, "8M"}), 0);
        device_ = std::make_unique<LoopDevice>(image);
        if (device_->name().empty())
            GTEST_SKIP() << "no loop device can be set up here";
    }
    void TearDown() override
    {
        if (device_ && isMounted())
            test::runTool({"umount", device_->name()});
    }

    bool isMounted() const { return !placesOf(device_->name()).empty(); }
    // The kernel waits for whoever has it open, as udevd does for a moment (loop(4)).
    bool isDetached()
    {
        const auto name = std::filesystem::path(device_->name()).filename();
        const auto image = "/sys/block" / name / "loop/backing_file";
        for (int i = 0; i < 100 && std::filesystem::exists(image); ++i)
            ::usleep(100'000);
        if (std::filesystem::exists(image))
            return false;
        device_->forget();
        return true;
    }
    std::vector<std::string> doIt(DiskAction action, DiskStep::Kind kind)
    {
        std::optional<std::vector<std::string>> told;
        operations_.start({request(action, kind, device_->name())},
                          [&](const std::vector<std::string>& failures) { told = failures; });
        EXPECT_TRUE(operations_.isUnderWay(device_->name()));
        loop_.runUntil([&] { return told.has_value(); });
        EXPECT_FALSE(operations_.isUnderWay(device_->name()));
        return *told;
    }
    std::vector<std::string> mount() { return doIt(DiskAction::Mount, DiskStep::Kind::Mount); }
    std::vector<std::string> unmount()
    {
        return doIt(DiskAction::Unmount, DiskStep::Kind::Unmount);
    }
    std::vector<std::string> eject() { return doIt(DiskAction::Eject, DiskStep::Kind::DetachLoop); }

    static std::vector<std::string> nothing() { return {}; }

    /// An image that nobody uses is attached, and no job gets at the file until it is detached.
    void expectImageIsAttachedUntilItIsDetached() const
    {
        const std::string image = directory_ / "other.img";
        test::write(image, std::string(1 << 20, 'x'));
        contract::DiskReference disk;
        disk.storage = contract::DiskReference::Storage::FileRegion;
        disk.path = image;
        {
            const auto job = pellar::DiskClaim::take(disk, Access::ReadOnly, {});
            ASSERT_TRUE(job);
            EXPECT_EQ(kindOf(attachImage(image, Access::ReadWrite)), Kind::BeingUsed);
        }
        for (const Access access : {Access::ReadWrite, Access::ReadOnly}) {
            const auto answer = attachImage(image, access);
            ASSERT_EQ(answer.index(), 0U) << reasonText(std::get<Refusal>(answer), texts_);
            const std::filesystem::path node = std::get<std::string>(answer);
            std::ifstream isReadOnly("/sys/block" / node.filename() / "ro");
            EXPECT_EQ(isReadOnly.get(), access == Access::ReadOnly ? '1' : '0');
            const auto again = attachImage(image, Access::ReadOnly);
            ASSERT_EQ(again.index(), 1U);
            EXPECT_EQ(std::get<Refusal>(again), (Refusal{Kind::Attached, node}));
            const auto job = pellar::DiskClaim::take(disk, Access::ReadOnly, {});
            EXPECT_FALSE(job) << "a job on the file, too";
            const auto request =
                orvane::request(DiskAction::Detach, DiskStep::Kind::DetachLoop, node);
            EXPECT_EQ(carryOut(request).index(), 0U);
        }
        EXPECT_TRUE(pellar::DiskClaim::take(disk, Access::ReadWrite, {})) << "no lock is left";
    }

    const TemporaryDirectory directory_;
    std::unique_ptr<LoopDevice> device_;
    const Translator texts_;
    MainLoop loop_;
    DiskOperations operations_{loop_, texts_};
};

/// With the UDisks2 of this machine.
class UDisksTest : public DeviceTest {
protected:
    void SetUp() override
    {
        DeviceTest::SetUp();
        if (IsSkipped() || HasFatalFailure())
            return;
        // udevd has to tell it of the device first.
        for (int i = 0; i < 100; ++i) {
            const auto answer = UDisks().unmount(device_->name());
            if (kindOf(answer) == Kind::AlreadySo)
                return;
            if (kindOf(answer) == Kind::NoService)
                GTEST_SKIP() << "no UDisks2 runs here";
            ::usleep(100'000);
        }
        FAIL() << "UDisks2 does not learn of new devices";
    }
};

TEST_F(UDisksTest, ADeviceIsMountedUnmountedAndEjected)
{
    EXPECT_EQ(mount(), nothing());
    EXPECT_TRUE(isMounted());
    EXPECT_EQ(mount(), nothing()) << "what is so already is no failure";
    const auto place = placesOf(device_->name());
    ASSERT_FALSE(place.empty());
    {
        const std::ofstream file(place.front().target + "/file");
        const auto failures = unmount();
        ASSERT_EQ(failures.size(), 1U);
        EXPECT_NE(failures.front().find("(" + std::to_string(::getpid()) + ")"), std::string::npos)
            << "names who holds it: " << failures.front();
    }
    EXPECT_EQ(unmount(), nothing());
    EXPECT_FALSE(isMounted());
    EXPECT_EQ(eject(), nothing());
    EXPECT_TRUE(isDetached());
}

TEST_F(UDisksTest, AnImageIsAttachedUntilItIsDetached)
{
    expectImageIsAttachedUntilItIsDetached();
}

TEST_F(UDisksTest, ALoopDeviceHasNoDriveToEject)
{
    EXPECT_EQ(kindOf(UDisks().eject(device_->name())), Kind::CannotEject);
}

/// Without any UDisks2, as root.
class DirectTest : public DeviceTest {
protected:
    const Setting nowhere_{"DBUS_SYSTEM_BUS_ADDRESS", "unix:path=/nonexistent/bus"};
    const Setting table_{"LIBMOUNT_FSTAB", directory_ / "fstab"};
};

TEST_F(DirectTest, RootMountsWhereTheTableSays)
{
    auto failures = mount();
    ASSERT_EQ(failures.size(), 1U);
    EXPECT_NE(failures.front().find("fstab"), std::string::npos) << failures.front();
    EXPECT_FALSE(isMounted());

    const std::string target = directory_ / "mnt";
    std::filesystem::create_directory(target);
    test::write(directory_ / "fstab", device_->name() + " " + target + " ext4 ro,noauto 0 0\n");
    EXPECT_EQ(mount(), nothing());
    ASSERT_EQ(placesOf(device_->name()).size(), 1U);
    EXPECT_EQ(placesOf(device_->name()).front().target, target);
    EXPECT_EQ(unmount(), nothing());
    EXPECT_FALSE(isMounted());
    EXPECT_EQ(eject(), nothing());
    EXPECT_TRUE(isDetached());
}

TEST_F(DirectTest, RootAttachesAnImageUntilItIsDetached)
{
    expectImageIsAttachedUntilItIsDetached();
}

TEST_F(DirectTest, AnImageInUseComesOffLater)
{
    const FileDescriptor user(::open(device_->name().c_str(), O_RDONLY | O_CLOEXEC));
    EXPECT_EQ(
        kindOf(carryOut(request(DiskAction::Detach, DiskStep::Kind::DetachLoop, device_->name()))),
        Kind::Lingers);
}

// With the one step that could do no harm to it.
TEST_F(DirectTest, TheSystemsRootIsLeftAlone)
{
    const auto mounts = pellar::currentMounts();
    const auto root = std::find_if(mounts.begin(), mounts.end(),
                                   [](const pellar::Mount& mount) { return mount.target == "/"; });
    if (root == mounts.end() || placesOf(root->source).empty())
        GTEST_SKIP() << "the root of this system is on no device";
    EXPECT_EQ(
        kindOf(carryOut(request(DiskAction::Eject, DiskStep::Kind::DetachLoop, root->source))),
        Kind::HoldsSystem);
}

using Options = std::map<std::string, sdbus::Variant>;

template <class Function>
void addMethod(sdbus::IObject& object, const char* interface, const char* name, Function function)
{
#if ORVANE_SDBUS == 2
    object.addVTable(sdbus::registerMethod(name).implementedAs(std::move(function)))
        .forInterface(std::string(interface));
#else
    object.registerMethod(name).onInterface(interface).implementedAs(std::move(function));
#endif
}

/// Adds properties of one interface, each with what gives its value.
template <class... Getter>
void addProperties(sdbus::IObject& object, const char* interface,
                   std::pair<const char*, Getter>... properties)
{
#if ORVANE_SDBUS == 2
    object.addVTable(sdbus::registerProperty(properties.first).withGetter(properties.second)...)
        .forInterface(std::string(interface));
#else
    (object.registerProperty(properties.first).onInterface(interface).withGetter(properties.second),
     ...);
#endif
}

/// When all has been added.
void finish([[maybe_unused]] sdbus::IObject& object)
{
#if ORVANE_SDBUS == 1
    object.finishRegistration();
#endif
}

/// A UDisks2 with one failing drive and one volume on it, which mounts when it is told to.
class FakeUDisks {
public:
    explicit FakeUDisks(const std::string& address)
        : connection_(sdbus::createSessionBusConnectionWithAddress(address))
    {
        root_ = add("");
        root_->addObjectManager();
        manager_ = add("/Manager");
        addMethod(
            *manager_, "org.freedesktop.UDisks2.Manager", "ResolveDevice",
            [](const Options&, const Options&) {
                return std::vector{sdbus::ObjectPath("/org/freedesktop/UDisks2/block_devices/x")};
            });
        finish(*manager_);
        addVolume();
        addDrive();
        finish(*volume_);
        finish(*drive_);
        connection_->requestName(BusServiceName("org.freedesktop.UDisks2"));
        connection_->enterEventLoopAsync();
    }
    ~FakeUDisks() { connection_->leaveEventLoop(); }

    std::atomic<bool> isAsked = false;
    std::atomic<bool> answers = false;

private:
    std::unique_ptr<sdbus::IObject> add(const std::string& path)
    {
        return sdbus::createObject(*connection_,
                                   sdbus::ObjectPath("/org/freedesktop/UDisks2" + path));
    }
    void addVolume()
    {
        volume_ = add("/block_devices/x");
        addMethod(*volume_, "org.freedesktop.UDisks2.Filesystem", "Mount",
                  [this](sdbus::Result<std::string>&& result, const Options&) {
                      if (answers)
                          result.returnResults("/mnt");
                      else
                          unanswered_.push_back(std::move(result));
                      isAsked = true;
                  });
        addProperties(*volume_, "org.freedesktop.UDisks2.Block",
                      std::pair{"Device",
                                [] {
                                    return std::vector<std::uint8_t>{'/', 'd', 'e', 'v',
                                                                     '/', 'x', 0};
                                }},
                      std::pair{"Drive", [] {
                                    return sdbus::ObjectPath("/org/freedesktop/UDisks2/drives/d");
                                }});
    }
    void addDrive()
    {
        drive_ = add("/drives/d");
        addProperties(*drive_, "org.freedesktop.UDisks2.Drive.Ata",
                      std::pair{"SmartUpdated",
                                [] {
                                    return std::uint64_t{1700000000};
                                }},
                      std::pair{"SmartFailing", [] {
                                    return true;
                                }});
    }

    std::unique_ptr<sdbus::IConnection> connection_;
    std::vector<sdbus::Result<std::string>> unanswered_;
    std::unique_ptr<sdbus::IObject> root_, manager_, volume_, drive_;
};

class FakeUDisksTest : public testing::Test {
protected:
    void SetUp() override
    {
        if (!bus_.isRunning())
            GTEST_SKIP() << "no bus can be started (package dbus-daemon)";
    }
    void start(DiskOperations& operations)
    {
        told_.reset();
        operations.start({request(DiskAction::Mount, DiskStep::Kind::Mount, "/dev/x")},
                         [this](const std::vector<std::string>& failures) { told_ = failures; });
    }
    void waitUntilAsked(const FakeUDisks& fake)
    {
        while (!fake.isAsked)
            ::usleep(1000);
    }

    const test::BusDaemon bus_;
    const Setting address_{"DBUS_SYSTEM_BUS_ADDRESS", bus_.address()};
    const Translator texts_;
    MainLoop loop_;
    std::optional<std::vector<std::string>> told_;
};

TEST_F(FakeUDisksTest, ItMayEndInTheMiddleAndComeBack)
{
    DiskOperations operations(loop_, texts_);
    auto first = std::make_unique<FakeUDisks>(bus_.address());
    start(operations);
    waitUntilAsked(*first);
    first.reset();
    loop_.runUntil([&] { return told_.has_value(); });
    EXPECT_EQ(*told_,
              std::vector<std::string>{"cannot mount “/dev/x”: UDisks2 ended in the middle of it"});

    FakeUDisks second(bus_.address());
    second.answers = true;
    start(operations);
    loop_.runUntil([&] { return told_.has_value(); });
    EXPECT_EQ(*told_, std::vector<std::string>());
}

TEST_F(FakeUDisksTest, TheProgramEndsWithoutWaitingForAnAnswer)
{
    const FakeUDisks fake(bus_.address());
    {
        DiskOperations operations(loop_, texts_);
        start(operations);
        waitUntilAsked(fake);
    }
    loop_.runUntil([] { return true; });
    EXPECT_FALSE(told_) << "who wanted to know may be gone";
}

TEST_F(FakeUDisksTest, TheHealthOfAllDrivesComesWithOneCall)
{
    const auto ask = [](std::chrono::milliseconds longest) {
        UDisks udisks;
        udisks.askForFailingDrives();
        return udisks.failingDrives(longest);
    };
    EXPECT_EQ(std::get<Refusal>(ask(20s)).kind, Kind::NoService);
    const FakeUDisks fake(bus_.address());
    EXPECT_EQ(std::get<0>(ask(20s)), (std::set<std::string>{"/dev/x"}));
}

}  // namespace
}  // namespace orvane
