// SPDX-License-Identifier: Apache-2.0
#include "pellar/disks/DiskClaim.h"

#include "pellar/mounts/MountTable.h"
#include "tests/pellar/JobFixture.h"
#include "tests/support/LoopDevice.h"

#include <gtest/gtest.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>

namespace {

using namespace pellar;
using contract::ErrorCode;

ErrorCode claimError(const std::filesystem::path& path, Access access = Access::ReadOnly,
                     const SystemPaths& paths = {})
{
    const auto claim = DiskClaim::take(*test::reference(path), access, paths);
    return claim ? contract::kPLNoError : claim.error();
}

TEST(DiskClaim, RefusesWhatIsNoDisk)
{
    const test::TestDirectory directory;
    EXPECT_EQ(claimError(directory.path("nothing")), contract::kPLErrorCannotOpen);
    EXPECT_EQ(claimError(directory.path("")), contract::kPLErrorCannotOpen) << "a directory";
    ASSERT_EQ(::mkfifo(directory.path("fifo").c_str(), 0600), 0);
    EXPECT_EQ(claimError(directory.path("fifo")), contract::kPLErrorCannotOpen);
    EXPECT_EQ(claimError("/dev/zero"), contract::kPLErrorCannotOpen);
}

TEST(DiskClaim, IsSharedByReadersAndKeptFromWriters)
{
    const test::TestDirectory directory;
    directory.write("disk", "x");
    const auto disk = test::reference(directory.path("disk"));
    {
        const auto reader = DiskClaim::take(*disk, Access::ReadOnly, {});
        EXPECT_EQ(claimError(disk->path), contract::kPLNoError);
        EXPECT_EQ(claimError(disk->path, Access::ReadWrite), contract::kPLErrorDiskInUse);
    }
    const auto writer = DiskClaim::take(*disk, Access::ReadWrite, {});
    EXPECT_EQ(claimError(disk->path), contract::kPLErrorDiskInUse);
}

TEST(DiskClaim, RefusesTheFileBehindALoopDevice)
{
    const test::TestDirectory directory;
    directory.write("disk", "x");
    directory.write("other", "x");
    std::filesystem::create_hard_link(directory.path("disk"), directory.path("second name"));
    std::filesystem::create_directories(directory.path("block/loop0/loop"));
    std::filesystem::create_directories(directory.path("block/sda"));
    directory.write("block/loop0/loop/backing_file", directory.path("second name").string() + "\n");
    const SystemPaths paths{directory.path("block"), "/proc/self/mountinfo"};
    EXPECT_EQ(claimError(directory.path("disk"), Access::ReadOnly, paths),
              contract::kPLErrorDiskInUse);
    EXPECT_EQ(claimError(directory.path("other"), Access::ReadOnly, paths), contract::kPLNoError);
}

// The device manager locks a device while it looks at it, and the main thread does not wait.
TEST(DiskClaim, ALockedDeviceIsWaitedForByTheJob)
{
    if (const char* const obstacle = orvane::test::LoopDevice::obstacle())
        GTEST_SKIP() << obstacle;
    const test::TestDirectory directory;
    const orvane::test::LoopDevice device(directory.makeExt("disk", 16U << 20U));
    const auto disk = test::reference(device.name());
    const FileDescriptor other(::open(device.name().c_str(), O_RDONLY | O_CLOEXEC));
    for (const bool isLetGo : {true, false}) {
        ASSERT_EQ(::flock(other.get(), LOCK_EX), 0);
        test::JobFixture library;
        const auto begun = library.tool->beginStoragesystemFilesystemVerifyForDisk(disk);
        EXPECT_EQ(begun, contract::kPLNoError);
        EXPECT_EQ(DiskClaim::attempt(*disk, Access::ReadOnly, {}).index(), 2U) << "locked still";
        if (isLetGo)
            ::flock(other.get(), LOCK_UN);
        library.finish(begun);
        EXPECT_EQ(library.listener.error,
                  isLetGo ? contract::kPLNoError : contract::kPLErrorDiskInUse);
    }
}

TEST(DiskClaim, NoticesThatTheDiskBecameShorter)
{
    const test::TestDirectory directory;
    directory.write("disk", std::string(10'000, 'x'));
    auto disk = *test::reference(directory.path("disk"));
    disk.offset = 4096;
    disk.length = 4096;
    const auto claim = DiskClaim::take(disk, Access::ReadOnly, {});
    EXPECT_EQ(claim->availableBytes(), 4096U);
    std::filesystem::resize_file(disk.path, 8192);
    EXPECT_TRUE(claim->isStillWhole()) << "the region is still there";
    std::filesystem::resize_file(disk.path, 8191);
    EXPECT_FALSE(claim->isStillWhole());
}

TEST(DiskClaim, NoticesThatItsNameLeadsElsewhere)
{
    const test::TestDirectory directory;
    for (const char* const what : {"deleted", "moved", "replaced"}) {
        directory.write("disk", std::string(10'000, 'x'));
        const auto disk = *test::reference(directory.path("disk"));
        const auto claim = DiskClaim::take(disk, Access::ReadOnly, {});
        EXPECT_TRUE(claim->isStillInPlace());
        std::filesystem::rename(disk.path, directory.path("elsewhere"));
        if (what == std::string_view("deleted"))
            std::filesystem::remove(directory.path("elsewhere"));
        else if (what == std::string_view("replaced"))
            directory.write("disk", std::string(10'000, 'x'));
        EXPECT_FALSE(claim->isStillInPlace()) << what;
        EXPECT_TRUE(claim->isStillWhole()) << what;
    }
}

TEST(MountTable, FindsADeviceByItsNumberOrItsSource)
{
    const auto mounts = parseMounts(
        "22 1 8:2 / / rw,relatime shared:1 - ext4 /dev/sda2 rw,seclabel,errors=remount-ro\n"
        "30 22 8:3 /sub /bind rw - ext4 /dev/sda3 rw\n"
        "31 22 8:3 / /media/My\\040Disk\\134 ro,nosuid - ext4 /dev/sda3 rw\n"
        "32 22 0:40 /@home /home rw master:2 shared:3 - btrfs /dev/sdb1 ro,errors=remount-ro\n"
        "33 22 8:17 / /gone rw - ext4 /dev/sdb1 rw\n"
        "nonsense\n33 22 8:4\n");
    ASSERT_EQ(mounts.size(), 5U) << "lines that are no mounts are left out";
    const auto media = mountOfDevice(mounts, makedev(8, 3), "/dev/sda3");
    ASSERT_TRUE(media);
    EXPECT_EQ(media->target, "/media/My Disk\\") << "the whole goes before a part of it";
    EXPECT_TRUE(media->isReadOnly);
    EXPECT_EQ(mountOfDevice(mounts, makedev(8, 33), "/dev/sdb1")->target, "/home")
        << "several devices, one number of its own; a device of another number has had the name";
    EXPECT_EQ(mounts[0].options, "rw,relatime,errors=remount-ro") << "what the kernel takes";
    EXPECT_FALSE(mounts[3].isReadOnly) << "the kernel's answer to an error is nobody's wish";
    EXPECT_FALSE(mounts[3].isBind()) << "a subvolume is mounted by an option";
    EXPECT_FALSE(mountOfDevice(mounts, makedev(8, 9), "/dev/sda9"));
    EXPECT_EQ(mountHolding(mounts, "/home/me")->device, makedev(0, 40));
    EXPECT_EQ(mountHolding(mounts, "/homes")->device, makedev(8, 2));
}

TEST(MountTable, WhatIsNotKnownToBeFreeIsMounted)
{
    const test::TestDirectory directory;
    directory.write("mounts",
                    "36 35 8:17 / /mnt rw - ext4 /dev/sdb1 rw\n"
                    "37 36 0:21 /8:2 /proc rw - proc 8:3 rw\n38");
    directory.write("none", "");
    const auto isIn = [](const std::filesystem::path& list, unsigned minor) {
        return isMounted(makedev(8, minor), {"/sys/block", list});
    };
    EXPECT_TRUE(isIn(directory.path("mounts"), 17));
    for (const unsigned minor : {1U, 2U, 3U})
        EXPECT_FALSE(isIn(directory.path("mounts"), minor)) << minor;
    EXPECT_FALSE(isIn(directory.path("none"), 17));
    EXPECT_TRUE(isIn("/nonexistent", 17));
    EXPECT_TRUE(isIn("/", 17));
}

}  // namespace
