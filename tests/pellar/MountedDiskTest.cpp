// SPDX-License-Identifier: Apache-2.0
// Jobs on volumes that are mounted, on real loop devices. Needs root.

#include "contract/pellar/ErrorCodes.h"
#include "pellar/mounts/Holders.h"
#include "pellar/mounts/MountTable.h"
#include "pellar/mounts/UnmountedDisk.h"
#include "tests/pellar/JobFixture.h"
#include "tests/pellar/partitions/DiskMaker.h"
#include "tests/support/LoopDevice.h"

#include <gtest/gtest.h>
#include <signal.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <fstream>
#include <functional>

namespace {

using namespace pellar;

namespace fs = std::filesystem;

/// A mounted volume, and a second place with a part of it.
class MountedDisk : public testing::Test {
protected:
    void SetUp() override
    {
        if (const char* const obstacle = orvane::test::LoopDevice::obstacle())
            GTEST_SKIP() << obstacle;
        device_ =
            std::make_unique<orvane::test::LoopDevice>(directory_.makeExt("disk", 16U << 20U));
        for (const char* name : {"place", "other"})
            fs::create_directory(directory_.path(name));
        if (::mount(device_->name().c_str(), place().c_str(), "ext4",
                    MS_NOSUID | MS_NOATIME | MS_NODEV, "errors=continue,commit=7") != 0)
            GTEST_SKIP() << "the system lets nobody mount here";
        fs::create_directory(place() / "part");
        mountPart(directory_.path("other"));
        before_ = mounts();
        ASSERT_EQ(before_.size(), 2U);
    }

    void TearDown() override
    {
        while (device_ && !mounts().empty())
            if (::umount2(mounts().back().target.c_str(), MNT_DETACH) != 0)
                break;
    }

    void mountPart(const fs::path& at) const
    {
        const fs::path part = place() / "part";
        ASSERT_EQ(::mount(part.c_str(), at.c_str(), nullptr, MS_BIND, nullptr), 0);
    }
    fs::path place() const { return directory_.path("place"); }
    std::vector<Mount> mounts() const
    {
        struct stat status = {};
        ::stat(device_->name().c_str(), &status);
        return mountsOf(status.st_rdev, {});
    }
    contract::DiskReferencePointer disk() const { return test::reference(device_->name()); }
    /// A program that verifies the disk is killed while it is unmounted.
    void expectMountedAgainAfterKill() const;

    test::TestDirectory directory_;
    std::unique_ptr<orvane::test::LoopDevice> device_;
    std::vector<Mount> before_;
};

TEST_F(MountedDisk, IsUnmountedForTheJobAndMountedAgainAsItWas)
{
    for (const auto& [script, repairs, verdict] : {std::tuple("", false, "sound"),  // the real tool
                                                   {"", true, "sound"},
                                                   {"kill 9", false, "failed"},
                                                   {"exit 16", true, "failed"},
                                                   {"say e2fsck 1.47.0\nwait", false, "stopped"}}) {
        JobOptions options;
        if (*script != '\0')
            options.toolPath = directory_.fakeTools(script);
        test::JobFixture library(options);
        const bool isStopped = verdict == std::string_view("stopped");
        bool isUnmounted = false;
        library.listener.onMessage = [&] {
            isUnmounted = isUnmounted || mounts().empty();
            if (library.listener.hasPlainLine("e2fsck 1.47.0") && isStopped)
                library.tool->cancelCurrentOperation();
        };
        EXPECT_EQ(repairs ? library.repair(disk()) : library.verify(disk()), 0) << script;
        EXPECT_TRUE(isUnmounted || !isStopped) << "taken for the job";
        EXPECT_EQ(library.listener.verdict, verdict) << script << library.listener.message;
        EXPECT_EQ(mounts(), before_) << script;
        EXPECT_TRUE(fs::is_directory(directory_.path("place") / "part"));
        EXPECT_EQ(::waitpid(-1, nullptr, WNOHANG), -1) << "a process is left";
    }
}

TEST_F(MountedDisk, StaysWhereItIsWhenNothingIsToBeUnmounted)
{
    JobOptions options;
    options.unmounts = false;
    test::JobFixture library(options);
    for (const bool repairs : {false, true})
        EXPECT_NE(repairs ? library.repair(disk()) : library.verify(disk()), 0);
    EXPECT_EQ(mounts(), before_);
}

/// A job in a process of its own, to be killed.
class OtherProgram {
public:
    OtherProgram(const JobOptions& options, const contract::DiskReferencePointer& disk,
                 bool repairs)
        : id_(::fork())
    {
        if (id_ != 0)
            return;
        test::JobFixture library(options);
        static_cast<void>(repairs ? library.repair(disk) : library.verify(disk));
        ::_exit(0);
    }
    void kill()
    {
        ::kill(id_, SIGKILL);
        ::waitpid(id_, nullptr, 0);
    }

private:
    pid_t id_;
};

[[nodiscard]] bool comesTrue(const std::function<bool()>& condition)
{
    for (int tries = 0; tries < 1000 && !condition(); ++tries)
        ::usleep(10'000);
    return condition();
}

void MountedDisk::expectMountedAgainAfterKill() const
{
    OtherProgram verification(test::with(&JobOptions::toolPath, directory_.fakeTools("wait")),
                              disk(), false);
    EXPECT_TRUE(comesTrue([this] { return mounts().empty(); }));
    verification.kill();
    EXPECT_TRUE(comesTrue([this] { return mounts() == before_; }));
}

TEST_F(MountedDisk, IsMountedAgainWhenTheProgramIsKilled)
{
    expectMountedAgainAfterKill();
    const std::string tools = directory_.fakeTools(
        "ignore 15\nsay Free blocks count wrong (1, counted=2).  Fix? no\nawait-in-repair end\n"
        "exit 4");
    OtherProgram repair(test::with(&JobOptions::toolPath, tools), disk(), true);
    ASSERT_TRUE(comesTrue([this] { return mounts().empty(); }));
    ::usleep(1'000'000);  // the tool has begun
    repair.kill();
    ::usleep(500'000);
    EXPECT_TRUE(mounts().empty()) << "a tool that writes is waited for";
    std::ofstream(tools + "/end");
    EXPECT_TRUE(comesTrue([this] { return mounts() == before_; }));
}

// What the owner of a directory on the way does while nothing is mounted. Aimed at /etc, a link
// would make its files theirs.
TEST_F(MountedDisk, NobodyLeadsItElsewhereMeanwhile)
{
    struct Case {
        std::function<void(const fs::path& mnt)> meanwhile;
        std::string found;  ///< where it is mounted again; empty: nowhere
        std::string_view because;
        uid_t owner = 65534;
    };
    const auto replaceByLink = [this](const fs::path& mnt) {
        fs::rename(mnt / "stick", mnt / "away");
        fs::create_directory_symlink(directory_.path("victim"), mnt / "stick");
    };
    const std::vector<Case> cases{
        {replaceByLink, "", "a link to a directory of root's"},
        {[this](const fs::path& mnt) {
             fs::rename(mnt / "stick", mnt / "away");
             fs::create_directory(mnt / "stick");
         },
         "", "another directory"},
        {[this](const fs::path& mnt) {
             fs::rename(mnt, mnt.parent_path() / "moved");
             fs::create_directory_symlink(directory_.path("victim"), mnt);
         },
         "alice/moved/stick", "the same directory, wherever it is"},
        {[](const fs::path& mnt) { fs::remove(mnt / "stick"); }, "", "gone"},
        {[](const fs::path& mnt) { fs::remove(mnt / "stick"); }, "alice/mnt/stick",
         "taken away by what had made it, and nobody else could have put something there", 0},
    };
    for (const auto& place : {directory_.path("other"), place()})
        ASSERT_EQ(::umount(place.c_str()), 0);
    fs::create_directories(directory_.path("victim/stick"));
    for (const Case& c : cases)
        for (const bool isKilled : {false, true}) {
            const fs::path alice = directory_.path("alice");
            fs::remove_all(alice);
            fs::create_directories(alice / "mnt/stick");
            ASSERT_EQ(::chown((alice / "mnt").c_str(), c.owner, 0), 0);
            ASSERT_EQ(::mount(device_->name().c_str(), (alice / "mnt/stick").c_str(), "ext4",
                              MS_NOSUID, nullptr),
                      0);
            const auto places = [this] {
                return mounts().empty() ? "" : mounts().front().target;
            };
            const std::string expected = c.found.empty() ? "" : directory_.path(c.found).native();
            const auto options = test::with(&JobOptions::toolPath, directory_.fakeTools("wait"));
            if (isKilled) {
                OtherProgram verification(options, disk(), false);
                ASSERT_TRUE(comesTrue([this] { return mounts().empty(); }));
                c.meanwhile(alice / "mnt");
                verification.kill();
                ::usleep(expected.empty() ? 700'000 : 0);
                EXPECT_TRUE(comesTrue([&] { return places() == expected; }))
                    << c.because << ": " << places();
            } else {
                test::JobFixture library(options);
                ASSERT_EQ(library.tool->beginStoragesystemFilesystemVerifyForDisk(disk()), 0);
                ASSERT_TRUE(library.loop.runUntil([&] { return mounts().empty(); }));
                c.meanwhile(alice / "mnt");
                library.tool->cancelCurrentOperation();
                ASSERT_TRUE(library.loop.runUntil([&] { return library.listener.finished == 1; }));
                EXPECT_EQ(places(), expected) << c.because;
                const auto errors = library.listener.textsOf(contract::kFsckError);
                EXPECT_EQ(errors.empty(), !expected.empty()) << c.because;
            }
            for (const Mount& place : mounts())
                ::umount(place.target.c_str());
        }
}

// The directory that holds the second place is on the disk itself.
TEST_F(MountedDisk, IsMountedAgainWhereItLiesOnItself)
{
    fs::create_directories(place() / "in/self");
    mountPart(place() / "in/self");
    before_ = mounts();
    test::JobFixture library;
    EXPECT_EQ(library.verify(disk()), 0);
    EXPECT_EQ(library.listener.verdict, "sound") << library.listener.message;
    EXPECT_EQ(mounts(), before_);
    expectMountedAgainAfterKill();
}

// By its path, one would unmount the other disk.
TEST_F(MountedDisk, WhatLiesOverItIsLeftAlone)
{
    ASSERT_EQ(::mount("tmpfs", place().c_str(), "tmpfs", 0, nullptr), 0);
    std::ofstream(place() / "kept") << "x";
    test::JobFixture library;
    EXPECT_EQ(library.verify(disk()), 0);
    EXPECT_EQ(library.listener.error, contract::kPLErrorCouldNotUnmount);
    EXPECT_TRUE(test::contains(library.listener.message, "something else over it"));
    EXPECT_TRUE(fs::exists(place() / "kept"));
    EXPECT_EQ(mounts(), before_);
    ::umount(place().c_str());
}

TEST_F(MountedDisk, IsMountedAgainOverWhatLiesBelowWhenTheProgramIsKilled)
{
    const fs::path covered = directory_.path("covered");
    fs::create_directory(covered);
    ASSERT_EQ(::mount("tmpfs", covered.c_str(), "tmpfs", 0, nullptr), 0);
    ASSERT_EQ(::mount(device_->name().c_str(), covered.c_str(), "ext4", 0, nullptr), 0);
    before_ = mounts();
    expectMountedAgainAfterKill();
    for (const Mount& place : mounts())
        ::umount2(place.target.c_str(), MNT_DETACH);
    ::umount(covered.c_str());
}

// The program behind it would have to be started anew.
TEST_F(MountedDisk, AFileSystemOfFUSEStaysMounted)
{
    std::vector<Mount> places = mounts();
    for (Mount& place : places)
        place.filesystem = "fuseblk";
    EXPECT_FALSE(UnmountedDisk::take(places, {}));
    EXPECT_EQ(mounts(), before_);
}

TEST_F(MountedDisk, WhoHoldsItIsNamedAndNothingIsChanged)
{
    const auto refusal = [this] {
        test::JobFixture library;
        EXPECT_EQ(library.verify(disk()), 0);
        EXPECT_EQ(library.listener.error, contract::kPLErrorCouldNotUnmount);
        EXPECT_EQ(mounts(), before_);
        return library.listener.message;
    };
    {
        const std::ofstream open(place() / "file");
        const std::string holder = "in use by pellar-tests (" + std::to_string(::getpid()) + ")";
        EXPECT_TRUE(test::contains(refusal(), holder));
    }
    fs::create_directory(place() / "below");
    ASSERT_EQ(::mount("tmpfs", (place() / "below").c_str(), "tmpfs", 0, nullptr), 0);
    EXPECT_TRUE(
        test::contains(refusal(), "something else below, at " + (place() / "below").native()));
    ASSERT_EQ(::umount((place() / "below").c_str()), 0);
}

TEST(Holders, AreFoundByEveryWayOfHolding)
{
    const test::TestDirectory directory;
    const auto mount = directory.path("mount");
    const auto process = directory.path("proc/77");
    for (const auto& [link, target] : {std::pair("cwd", mount / "deep/directory"),
                                       {"root", mount},
                                       {"exe", mount / "bin/tool (deleted)"},
                                       {"fd/3", mount / "file"},
                                       {"fd/3", mount.native() + "ain/file"},
                                       {"cwd", "/"}}) {
        fs::remove_all(directory.path("proc"));
        fs::create_directories(process / "fd");
        fs::create_directory(directory.path("proc/self"));
        fs::create_symlink(target, process / link);
        std::ofstream(process / "comm") << "vim\n";
        const bool holds = target.native().starts_with(mount.native() + "/") || target == mount;
        EXPECT_EQ(holdersOf(mount.native(), directory.path("proc"), "/none"),
                  holds ? std::vector<std::string>{"vim (77)"} : std::vector<std::string>())
            << link << " " << target;
    }
    fs::remove(process / "cwd");
    std::ofstream(process / "maps")
        << "7f3a-7f3b r--p 00000000 08:01 131 " << mount.native() << "/lib.so\n";
    EXPECT_EQ(holdersOf(mount.native(), directory.path("proc"), "/none").size(), 1U) << "mapped";
    fs::create_directories(directory.path("block/loop3/loop"));
    std::ofstream(directory.path("block/loop3/loop/backing_file")) << (mount / "a.img").native();
    EXPECT_EQ(holdersOf(mount.native(), "/none", directory.path("block")),
              std::vector<std::string>{"loop3"});
}

using test::DiskImage;

// The kernel here may know no partition tables, so partx(8) adds the partition.
TEST(MapDevice, IsRepairedUnlessAPartitionIsMounted)
{
    if (const char* const obstacle = orvane::test::LoopDevice::obstacle())
        GTEST_SKIP() << obstacle;
    const test::TestDirectory workshop;
    const DiskImage disk = DiskImage::gpt(workshop);
    const Bytes sound = [&] {
        workshop.makeExt("volume", 4 * test::mebibyte);
        disk.put(2048 * 512, test::fileBytes(workshop.path("volume")));
        return disk.bytes();
    }();
    disk.fill(512, 512, 0);
    const orvane::test::LoopDevice device(disk.path());
    auto reference = std::make_shared<contract::DiskReference>(*test::wholeDisk(device.name()));
    reference->storage = contract::DiskReference::Storage::BlockDevice;
    reference->length = 0;
    test::JobFixture bench(test::tryingIn(workshop.path("saved")));

    if (test::runTool({"partx", "-a", "--nr", "1", device.name()}).status == 0) {
        std::filesystem::create_directory(workshop.path("mount"));
        if (test::runTool({"mount", device.name() + "p1", workshop.path("mount")}).status == 0) {
            bench.finish(bench.tool->beginPartitionMapRepairForDisk(reference));
            EXPECT_EQ(bench.listener.error, contract::kPLErrorDiskInUse) << bench.listener.message;
            bench.finish(bench.tool->beginPartitionMapVerifyForDisk(reference));
            EXPECT_EQ(bench.listener.error, contract::kPLErrorMapDamaged) << bench.listener.message;
            test::runTool({"umount", workshop.path("mount")});
        } else {
            ADD_FAILURE() << "a partition could not be mounted, so its use is not tested";
        }
    }
    bench.finish(bench.tool->beginPartitionMapRepairForDisk(reference));
    EXPECT_EQ(bench.listener.verdict, "repaired") << bench.listener.message;
    bench.finish(bench.tool->beginPartitionMapVerifyForDisk(reference));
    EXPECT_EQ(bench.listener.verdict, "sound") << bench.listener.message;
    // The device manager may have the partition open for a moment, and a partition that stays would
    // be found on whatever the device is used for next.
    for (int i = 0; i < 50 && test::runTool({"partx", "-d", device.name()}).status != 0; ++i)
        ::usleep(100'000);
    const Bytes after = disk.bytes();
    EXPECT_TRUE(std::equal(after.begin(), after.begin() + 34 * 512, sound.begin()));
}

}  // namespace
