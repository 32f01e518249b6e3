// SPDX-License-Identifier: Apache-2.0
#include "pellar/disks/DiskClaim.h"

#include "pellar/disks/DiskUse.h"
#include "tests/pellar/Workshop.h"
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
    const auto* const error = std::get_if<ErrorCode>(&claim);
    return error == nullptr ? contract::kPLNoError : *error;
}

TEST(DiskClaim, RefusesWhatIsNoDisk)
{
    const test::Workshop workshop;
    EXPECT_EQ(claimError(workshop.path("nothing")), contract::kPLErrorCannotOpen);
    EXPECT_EQ(claimError(workshop.path("")), contract::kPLErrorCannotOpen) << "a directory";
    ASSERT_EQ(::mkfifo(workshop.path("fifo").c_str(), 0600), 0);
    EXPECT_EQ(claimError(workshop.path("fifo")), contract::kPLErrorCannotOpen);
    EXPECT_EQ(claimError("/dev/zero"), contract::kPLErrorCannotOpen);
}

TEST(DiskClaim, IsSharedByReadersAndKeptFromWriters)
{
    const test::Workshop workshop;
    workshop.write("disk", "x");
    const auto disk = test::reference(workshop.path("disk"));
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
    const test::Workshop workshop;
    workshop.write("disk", "x");
    workshop.write("other", "x");
    std::filesystem::create_hard_link(workshop.path("disk"), workshop.path("second name"));
    std::filesystem::create_directories(workshop.path("block/loop0/loop"));
    std::filesystem::create_directories(workshop.path("block/sda"));
    workshop.write("block/loop0/loop/backing_file", workshop.path("second name").string() + "\n");
    const SystemPaths paths{workshop.path("block"), "/proc/self/mountinfo"};
    EXPECT_EQ(claimError(workshop.path("disk"), Access::ReadOnly, paths),
              contract::kPLErrorDiskInUse);
    EXPECT_EQ(claimError(workshop.path("other"), Access::ReadOnly, paths), contract::kPLNoError);
}

// The device manager locks a device while it looks at it, and the main thread waits for nobody.
TEST(DiskClaim, ALockedDeviceIsWaitedForByTheJob)
{
    if (const char* const obstacle = orvane::test::LoopDevice::obstacle())
        GTEST_SKIP() << obstacle;
    const test::Workshop workshop;
    const orvane::test::LoopDevice device(workshop.makeExt("disk", 16U << 20U));
    if (device.name().empty())
        GTEST_SKIP() << "the system gives no loop device";
    const auto disk = test::reference(device.name());
    const FileDescriptor other(::open(device.name().c_str(), O_RDONLY | O_CLOEXEC));
    for (const bool isLetGo : {true, false}) {
        ASSERT_EQ(::flock(other.get(), LOCK_EX), 0);
        test::Bench bench;
        const auto begun = bench.tool->beginStoragesystemFilesystemVerifyForDisk(disk);
        EXPECT_EQ(begun, contract::kPLNoError);
        EXPECT_EQ(DiskClaim::attempt(*disk, Access::ReadOnly, {}).index(), 2U) << "locked still";
        if (isLetGo)
            ::flock(other.get(), LOCK_UN);
        bench.finish(begun);
        EXPECT_EQ(bench.listener.error, isLetGo ? contract::kPLNoError : contract::kPLErrorDiskInUse);
    }
}

TEST(DiskClaim, NoticesThatTheDiskBecameShorter)
{
    const test::Workshop workshop;
    workshop.write("disk", std::string(10'000, 'x'));
    auto disk = *test::reference(workshop.path("disk"));
    disk.offset = 4096;
    disk.length = 4096;
    const auto taken = DiskClaim::take(disk, Access::ReadOnly, {});
    const auto& claim = std::get<DiskClaim>(taken);
    EXPECT_EQ(claim.availableBytes(), 4096U);
    std::filesystem::resize_file(disk.path, 8192);
    EXPECT_TRUE(claim.isStillWhole()) << "the region is still there";
    std::filesystem::resize_file(disk.path, 8191);
    EXPECT_FALSE(claim.isStillWhole());
}

TEST(DiskClaim, NoticesThatItsNameLeadsElsewhere)
{
    const test::Workshop workshop;
    for (const char* const what : {"deleted", "moved", "replaced"}) {
        workshop.write("disk", std::string(10'000, 'x'));
        const auto disk = *test::reference(workshop.path("disk"));
        const auto taken = DiskClaim::take(disk, Access::ReadOnly, {});
        const auto& claim = std::get<DiskClaim>(taken);
        EXPECT_TRUE(claim.isStillInPlace());
        std::filesystem::rename(disk.path, workshop.path("elsewhere"));
        if (what == std::string_view("deleted"))
            std::filesystem::remove(workshop.path("elsewhere"));
        else if (what == std::string_view("replaced"))
            workshop.write("disk", std::string(10'000, 'x'));
        EXPECT_FALSE(claim.isStillInPlace()) << what;
        EXPECT_TRUE(claim.isStillWhole()) << what;
    }
}

TEST(MountInfo, FindsADeviceByItsNumber)
{
    constexpr std::string_view mountInfo =
        "36 35 8:17 / /mnt rw,noatime shared:1 - ext4 /dev/sdb1 rw\n"
        "37 36 0:21 /8:2 /proc rw - proc 8:3 rw\n"
        "38";
    EXPECT_TRUE(mountInfoNames(mountInfo, 8, 17));
    EXPECT_FALSE(mountInfoNames(mountInfo, 8, 1)) << "the start of another number";
    EXPECT_FALSE(mountInfoNames(mountInfo, 8, 2)) << "in another column";
    EXPECT_FALSE(mountInfoNames(mountInfo, 8, 3)) << "in another column";
    EXPECT_FALSE(mountInfoNames("", 8, 17));
    for (const char* const unreadable : {"/nonexistent", "/"})  // opened, but not read
        EXPECT_TRUE(isMounted(makedev(8, 17), {"/sys/block", unreadable}))
            << "what is not known to be free is not touched";
}

}  // namespace
