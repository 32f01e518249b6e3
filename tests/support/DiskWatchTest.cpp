// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/disks/DiskController.h"
#include "orvane/support/disks/DiskWatch.h"
#include "orvane/support/disks/SystemDisks.h"
#include "orvane/support/loop/MainLoop.h"
#include "orvane/support/loop/Notifications.h"
#include "tests/support/LoopDevice.h"
#include "tests/support/TestDirectory.h"

#include <gtest/gtest.h>
#include <sys/mount.h>
#include <unistd.h>

#include <chrono>

namespace orvane {
namespace {

using namespace std::string_view_literals;
using namespace std::chrono_literals;
using test::LoopDevice;
using test::TestDirectory;

TEST(DiskEvents, OnlyBlockDevicesMatter)
{
    struct Case {
        std::string_view message;
        bool isMeant;
        std::string_view because;
    };
    for (const Case& c :
         {Case{"change@/devices/virtual/block/loop0\0ACTION=change\0SUBSYSTEM=block\0MAJOR=7\0"sv,
               true, "as the kernel says it"},
          Case{"libudev\0\xfe\xed\xca\xfe\x28\0\0\0ACTION=add\0SUBSYSTEM=block\0"sv, true,
               "as udevd says it"},
          Case{"add@/devices/x\0ACTION=add\0SUBSYSTEM=usb\0"sv, false, "another device"},
          Case{"add@/devices/x\0SUBSYSTEM=blocks\0"sv, false, "a longer name"},
          Case{"add@/devices/x\0MY=SUBSYSTEM=block\0"sv, false, "the value of another field"},
          Case{"\0SUBSYSTEM=block"sv, false, "cut off"}, Case{""sv, false, "empty"}})
        EXPECT_EQ(isAboutBlockDevice(c.message), c.isMeant) << c.because;
}

TEST(DiskEvents, MountsWithoutADeviceDoNotMatter)
{
    const auto kept = deviceMounts(pellar::parseMounts(
        "22 1 8:2 / / rw - ext4 /dev/sda2 rw\n30 22 0:5 / /proc rw - proc proc rw\n"
        "32 22 0:40 / /home rw - btrfs /dev/sdb1 rw\n"
        "33 22 0:50 / /c/1 rw - overlay overlay rw\n"));
    ASSERT_EQ(kept.size(), 2U);
    EXPECT_EQ(kept[1].filesystem, "btrfs") << "it has a number of its own, but a device";
}

TEST(DiskEvents, ABurstIsOneChange)
{
    const EventBurst::Clock::time_point start{};
    EventBurst burst;
    EXPECT_FALSE(burst.takeDue(start)) << "nothing has happened";
    burst.note(start);
    burst.note(start + 150ms);
    EXPECT_FALSE(burst.takeDue(start + 210ms)) << "not quiet yet";
    EXPECT_EQ(burst.timeLeft(start + 210ms), 140ms);
    EXPECT_TRUE(burst.takeDue(start + 350ms));

    int told = 0;
    for (auto now = start; now < start + 10s; now += 100ms) {
        burst.note(now);
        told += burst.takeDue(now) ? 1 : 0;
    }
    EXPECT_EQ(told, 9) << "events without end cannot keep the news back";
}

// The machine's own disks, as a front end follows them.
TEST(DiskWatch, ARealDeviceComesIsMountedUnmountedAndGoes)
{
    if (const char* const obstacle = LoopDevice::obstacle())
        GTEST_SKIP() << obstacle;
    const TestDirectory directory;
    // Another process may run this test at the same time.
    const std::string label = "watched" + std::to_string(::getpid());
    const std::string image = directory.makeExt("watched.img", 8 << 20, {"-L", label});
    MainLoop loop;
    Notifications center;
    DiskController disks(center, {});
    DiskWatch watch(loop, [&] { disks.synchronize(readSystemDisks(DiskSources())); });
    ASSERT_TRUE(watch.start());
    const auto found = [&] {
        return disks.find([&](const Disk& disk) { return disk.facts().label == label; });
    };
    const auto waitUntil = [&loop](const std::function<bool()>& isDone) {
        bool isLate = false;
        loop.scheduleTimer(20s, [&] { isLate = true; });
        loop.runUntil([&] { return isLate || isDone(); });
        return isDone();
    };
    LoopDevice device(image);
    ASSERT_TRUE(waitUntil([&] { return found() != nullptr; }));
    const auto disk = found();
    EXPECT_EQ(disk->diskIdentifier(), device.name());
    const std::string mountPoint = directory / "mnt";
    std::filesystem::create_directory(mountPoint);
    if (::mount(device.name().c_str(), mountPoint.c_str(), "ext4", 0, nullptr) == 0) {
        EXPECT_TRUE(waitUntil([&] { return disk->mountPoint() == mountPoint; }));
        ASSERT_EQ(::umount(mountPoint.c_str()), 0);
        EXPECT_TRUE(waitUntil([&] { return !disk->isMounted(); }));
    }
    device.detach();
    EXPECT_TRUE(waitUntil([&] { return found() == nullptr; }));
    EXPECT_TRUE(disk->hasGone());
}

}  // namespace
}  // namespace orvane
