// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/loop/MainLoop.h"
#include "orvane/support/udisks/BusCall.h"
#include "orvane/support/udisks/DirectDisks.h"
#include "orvane/support/udisks/DiskOperations.h"
#include "orvane/support/udisks/DiskReader.h"
#include "orvane/support/udisks/DiskRequest.h"
#include "orvane/support/udisks/UDisks.h"
#include "pellar/disks/DiskClaim.h"
#include "tests/support/BusDaemon.h"
#include "tests/support/BusObject.h"
#include "tests/support/LoopDevice.h"
#include "tests/support/TestDirectory.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <array>
#include <atomic>
#include <fstream>
#include <map>

namespace orvane {
namespace {

using Kind = Refusal::Kind;
using pellar::Access;
using test::addMethod;
using test::addProperties;
using test::always;
using test::finish;
using test::LoopDevice;
using test::SystemBus;
using test::TestDirectory;
using namespace std::chrono_literals;

DiskRequest request(DiskAction action, DiskStep::Kind kind, const std::string& node)
{
    return {action, node, node, {{kind, node}}};
}

/// What root may do to devices; an image is attached and detached again.
class DeviceTest : public testing::Test {
protected:
    void SetUp() override
    {
        if (const char* const obstacle = LoopDevice::obstacle())
            GTEST_SKIP() << obstacle;
    }

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
            EXPECT_EQ(attachImage(image, Access::ReadWrite).error().kind, Kind::BeingUsed);
        }
        for (const Access access : {Access::ReadWrite, Access::ReadOnly}) {
            const auto answer = attachImage(image, access);
            ASSERT_TRUE(answer) << reasonText(answer.error(), texts_);
            const std::filesystem::path node = *answer;
            std::ifstream isReadOnly("/sys/block" / node.filename() / "ro");
            EXPECT_EQ(isReadOnly.get(), access == Access::ReadOnly ? '1' : '0');
            EXPECT_EQ(attachImage(image, Access::ReadOnly).error(),
                      (Refusal{Kind::Attached, node}));
            EXPECT_FALSE(pellar::DiskClaim::take(disk, Access::ReadOnly, {})) << "a job, too";
            EXPECT_TRUE(carryOut(request(DiskAction::Detach, DiskStep::Kind::DetachLoop, node)));
        }
        EXPECT_TRUE(pellar::DiskClaim::take(disk, Access::ReadWrite, {})) << "no lock is left";
    }

    const TestDirectory directory_;
    const Translator texts_;
};

TEST_F(DeviceTest, AnImageIsAttachedByUDisksUntilItIsDetached)
{
    if (UDisks().unmount("/dev/null").error().kind == Kind::NoService)
        GTEST_SKIP() << "no UDisks2 runs here";
    expectImageIsAttachedUntilItIsDetached();
}

/// Without any UDisks2, as root.
class DirectTest : public DeviceTest {
protected:
    const SystemBus nowhere_{"unix:path=/nonexistent/bus"};
};

TEST_F(DirectTest, RootAttachesAnImageUntilItIsDetached)
{
    expectImageIsAttachedUntilItIsDetached();
}

TEST_F(DirectTest, AnImageInUseComesOffLater)
{
    test::write(directory_ / "volume.img", std::string(1 << 20, 'x'));
    const LoopDevice device(directory_ / "volume.img");
    const pellar::FileDescriptor user(::open(device.name().c_str(), O_RDONLY | O_CLOEXEC));
    const auto detached =
        carryOut(request(DiskAction::Detach, DiskStep::Kind::DetachLoop, device.name()));
    EXPECT_EQ(detached.error().kind, Kind::Lingers);
}

// With the one step that could do no harm to it.
TEST_F(DirectTest, TheSystemsRootIsLeftAlone)
{
    const auto mounts = pellar::currentMounts();
    const auto root = std::find_if(mounts.begin(), mounts.end(),
                                   [](const pellar::Mount& mount) { return mount.target == "/"; });
    if (root == mounts.end() || placesOf(root->source).empty())
        GTEST_SKIP() << "the root of this system is on no device";
    const auto detached =
        carryOut(request(DiskAction::Eject, DiskStep::Kind::DetachLoop, root->source));
    EXPECT_EQ(detached.error().kind, Kind::HoldsSystem);
}

using Options = std::map<std::string, sdbus::Variant>;

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
        volume_ = add("/block_devices/x");
        addMethod(*volume_, "org.freedesktop.UDisks2.Filesystem", "Mount",
                  [this](sdbus::Result<std::string>&& result, const Options&) {
                      if (answers)
                          result.returnResults("/mnt");
                      else
                          unanswered_.push_back(std::move(result));
                      isAsked = true;
                  });
        const std::string node("/dev/x\0", 7);
        const sdbus::ObjectPath drive("/org/freedesktop/UDisks2/drives/d");
        addProperties(
            *volume_, "org.freedesktop.UDisks2.Block",
            std::pair{"Device", always(std::vector<std::uint8_t>(node.begin(), node.end()))},
            std::pair{"Drive", always(drive)});
        finish(*volume_);
        drive_ = add("/drives/d");
        addProperties(*drive_, "org.freedesktop.UDisks2.Drive.Ata",
                      std::pair{"SmartUpdated", always(std::uint64_t{1700000000})},
                      std::pair{"SmartFailing", always(true)});
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
    const SystemBus address_{bus_.address()};
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
    EXPECT_TRUE(operations.isUnderWay("/dev/x"));
    first.reset();
    loop_.runUntil([&] { return told_.has_value(); });
    EXPECT_EQ(*told_,
              std::vector<std::string>{"cannot mount “/dev/x”: UDisks2 ended in the middle of it"});
    EXPECT_FALSE(operations.isUnderWay("/dev/x"));

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
    const auto ask = [] {
        UDisks udisks;
        udisks.askForFailingDrives();
        return udisks.failingDrives(20s);
    };
    EXPECT_EQ(ask().error().kind, Kind::NoService);
    const FakeUDisks fake(bus_.address());
    EXPECT_EQ(*ask(), (std::set<std::string>{"/dev/x"}));
}

DiskTree disk(const std::string& node, std::int32_t type, const std::string& mountPoint = "",
              std::vector<DiskTree> children = {})
{
    DiskTree tree{{}, std::move(children)};
    tree.facts.identifier = tree.facts.name = node;
    tree.facts.path = node;
    tree.facts.type = type;
    tree.facts.filesystem = type == diskType::whole ? "" : "ext4";
    tree.facts.mountPoint = mountPoint;
    tree.facts.isBootVolume = mountPoint == "/";
    return tree;
}

DiskTree ejectable(const std::string& node, std::vector<DiskTree> children)
{
    DiskTree tree = disk(node, diskType::whole, "", std::move(children));
    tree.facts.isEjectable = true;
    return tree;
}

TEST(DiskRequest, WhatIsPossibleFollowsFromTheDisk)
{
    DiskTree image = disk("/d.img", diskType::bareVolume);
    image.facts.storage = contract::DiskReference::Storage::FileRegion;
    DiskTree blank = disk("/dev/sdc1", diskType::volume);
    blank.facts.filesystem.clear();
    const DiskTree free = disk("/dev/sdb1", diskType::volume);
    const DiskTree mounted = disk("/dev/sdb2", diskType::volume, "/mnt");
    const DiskTree root = disk("/dev/sda1", diskType::volume, "/");
    constexpr std::optional<Kind> possible;
    struct Case {
        DiskTree tree;
        std::array<std::optional<Kind>, 4> objections;  ///< mount, unmount, eject, detach
        std::string_view because;
    };
    for (const Case& c :
         {Case{free, {possible, Kind::AlreadySo, Kind::CannotEject, Kind::IsNoLoop}, "a volume"},
          Case{mounted, {Kind::AlreadySo, possible, Kind::CannotEject, Kind::IsNoLoop}, "mounted"},
          Case{root,
               {Kind::AlreadySo, Kind::HoldsSystem, Kind::HoldsSystem, Kind::IsNoLoop},
               "the system needs its root"},
          Case{blank,
               {Kind::NoFilesystem, Kind::AlreadySo, Kind::CannotEject, Kind::IsNoLoop},
               "no file system is known"},
          Case{image,
               {Kind::IsImage, Kind::IsImage, Kind::IsImage, Kind::IsNoLoop},
               "an image file is no device"},
          Case{ejectable("/dev/sdb", {free, mounted}),
               {Kind::IsWhole, Kind::IsWhole, possible, Kind::IsNoLoop},
               "a stick"},
          Case{ejectable("/dev/loop7", {free, mounted}),
               {Kind::IsWhole, Kind::IsWhole, possible, possible},
               "an attached image"},
          Case{ejectable("/dev/loop7", {root}),
               {Kind::IsWhole, Kind::IsWhole, Kind::HoldsSystem, Kind::HoldsSystem},
               "one that the system runs from"},
          Case{disk("/dev/sdb", diskType::whole, "", {free}),
               {Kind::IsWhole, Kind::IsWhole, Kind::CannotEject, Kind::IsNoLoop},
               "a built-in disk"}}) {
        const auto made = Disk::make(c.tree, {});
        std::size_t i = 0;
        for (const DiskAction action :
             {DiskAction::Mount, DiskAction::Unmount, DiskAction::Eject, DiskAction::Detach}) {
            const auto objection = objectionTo(action, *made);
            EXPECT_EQ(objection ? std::optional(objection->kind) : possible, c.objections.at(i++))
                << c.because << ", action " << i;
        }
        made->setGone();
        EXPECT_EQ(objectionTo(DiskAction::Eject, *made), (Refusal{Kind::HasGone, {}}));
    }
}

TEST(DiskRequest, AnEjectedDriveIsUnmountedFirst)
{
    const auto stick = Disk::make(ejectable("/dev/sdb", {disk("/dev/sdb1", diskType::volume, "/a"),
                                                         disk("/dev/sdb2", diskType::volume)}),
                                  {});
    const auto request = requestFor(DiskAction::Eject, *stick->parts().back());
    EXPECT_EQ(request.identifier, "/dev/sdb") << "the part stands for its drive";
    EXPECT_EQ(request.steps, (std::vector<DiskStep>{{DiskStep::Kind::Unmount, "/dev/sdb1"},
                                                    {DiskStep::Kind::Eject, "/dev/sdb"}}));
    const auto loop = Disk::make(ejectable("/dev/loop7", {}), {});
    EXPECT_EQ(requestFor(DiskAction::Eject, *loop).steps,
              (std::vector<DiskStep>{{DiskStep::Kind::DetachLoop, "/dev/loop7"}}));
}

TEST(Refusal, AnErrorOfTheBusIsUnderstood)
{
    struct Case {
        std::string name;
        std::string_view text;
        Refusal refusal;
        std::string_view because;
    };
    const std::string bus = "org.freedesktop.DBus.Error.";
    const std::string udisks = "org.freedesktop.UDisks2.Error.";
    const std::string left = "Message recipient disconnected from message bus without replying";
    for (const Case& c :
         {Case{bus + "ServiceUnknown", "x", {Kind::NoService, "x"}, "not installed"},
          Case{bus + "Spawn.ChildExited", "x", {Kind::NoService, "x"}, "it did not come up"},
          Case{bus + "NoReply", left, {Kind::Ended, left}, "it died"},
          Case{bus + "NoReply", "timed out", {Kind::NoAnswer, "timed out"}, "it hangs"},
          Case{udisks + "NotAuthorizedDismissed", "", {Kind::Dismissed, ""}, "the longer name"},
          Case{udisks + "NotAuthorizedCanObtain", "", {Kind::NotAllowed, ""}, "all of them"},
          Case{udisks + "DeviceBusy", "target is busy", {Kind::Busy, ""}, "names nobody"},
          Case{udisks + "Failed",
               "wrong \x1b[31m\n%s\xff",
               {Kind::Other, "wrong \uFFFD[31m\uFFFD%s\uFFFD"},
               "a hostile label in it"},
          Case{udisks + "Failed", "", {Kind::Other, udisks + "Failed"}, "something must be said"}})
        EXPECT_EQ(refusalOf(c.name, c.text), c.refusal) << c.because;
}

TEST(Refusal, EveryOneThatIsNotSilentIsSaid)
{
    const auto mounted = Disk::make(disk("/d", diskType::volume, "/m"), {});
    const auto request = requestFor(DiskAction::Unmount, *mounted);
    for (int kind = 0; kind < static_cast<int>(Kind::Other); ++kind) {
        const Refusal refusal{static_cast<Kind>(kind), {}};
        EXPECT_TRUE(isSilent(refusal) ||
                    !failureText(request, refusal, Translator()).ends_with(": "))
            << "no reason for " << kind;
    }
    EXPECT_EQ(failureText(request, {Kind::Busy, "sh (7)"}, Translator()),
              "cannot unmount “/d”: it is in use by sh (7)");
}

TEST(DriveHealth, OnlyADriveThatSaysSoIsFailing)
{
    struct Case {
        DriveHealth drive;
        bool isFailing;
        std::string_view because;
    };
    for (const Case& c : {Case{{1700000000, true, {}}, true, "SMART says so"},
                          Case{{1700000000, false, {}}, false, "SMART denies it"},
                          Case{{0, true, {}}, false, "nobody has asked the drive"},
                          Case{{0, false, {"temperature"}}, false, "hot is not broken"},
                          Case{{0, false, {"temperature", "readonly"}}, true, "broken"}})
        EXPECT_EQ(isFailing(c.drive), c.isFailing) << c.because;

    std::vector<DiskTree> disks{
        disk("/dev/sda", diskType::whole, "", {disk("/dev/sda1", diskType::volume)}),
        disk("/dev/sdb", diskType::whole, "", {disk("/dev/sdb1", diskType::volume)})};
    markFailing(disks, {"/dev/sda"});
    EXPECT_TRUE(disks[0].children[0].facts.hasSMARTError) << "its parts fail with it";
    EXPECT_FALSE(disks[1].facts.hasSMARTError);
}

}  // namespace
}  // namespace orvane
