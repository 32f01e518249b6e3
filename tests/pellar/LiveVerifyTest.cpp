// SPDX-License-Identifier: Apache-2.0
// Volumes that are verified while they stay mounted, on real loop devices. Needs root.

#include "pellar/mounts/MountTable.h"
#include "pellar/process/Command.h"
#include "pellar/tools/btrfs/MountedBtrfs.h"
#include "tests/pellar/JobFixture.h"
#include "tests/support/LoopDevice.h"

#include <gtest/gtest.h>
#include <sys/mount.h>
#include <unistd.h>

#include <fstream>

namespace {

using namespace pellar;

using orvane::test::contentsOf;

namespace fs = std::filesystem;

/// A btrfs volume with one copy of its files and two of everything else, mounted as the place of
/// the user's home.
class LiveVerify : public testing::Test {
protected:
    static constexpr std::string_view fileText = "what stands in a file of its own";
    static constexpr std::string_view leafText = "what stands between the names of files";

    void SetUp() override
    {
        if (const char* const obstacle = orvane::test::LoopDevice::obstacle())
            GTEST_SKIP() << obstacle;
        directory_.makeFile("image", 128U << 20U);
        if (findProgram("mkfs.btrfs", JobOptions().toolPath).empty())
            GTEST_SKIP() << "mkfs.btrfs is not installed (package btrfs-progs)";
        orvane::test::prepareWith(
            {"mkfs.btrfs", "-q", "-U", uuid_, "-d", "single", "-m", "dup", image()});
        fs::create_directory(place());
        if (!mount())
            GTEST_SKIP() << "the system mounts no btrfs";
        std::string contents(16U << 20U, 'x');
        contents.replace(contents.size() / 2, fileText.size(), fileText);
        std::ofstream(place() / "large") << contents;
        std::ofstream(place() / "small") << leafText;  // so small that it stands in the tree
        unmount();
        ASSERT_TRUE(mount());
    }
    void TearDown() override
    {
        unmount();
        std::error_code ignored;
        fs::remove("/var/lib/btrfs/scrub.status." + uuid_, ignored);
        fs::remove("/var/lib/btrfs", ignored);  // unless somebody else's are there
    }

    /// The image as it stays when nothing else is written: mounting leaves work to the kernel.
    std::string settledContents() const
    {
        std::string contents;
        for (bool isSettled = false; !isSettled;) {
            ::sync();
            ::usleep(200'000);
            const std::string now = contentsOf(image());
            isSettled = std::exchange(contents, now) == now;
        }
        return contents;
    }
    bool mount()
    {
        device_ = std::make_unique<orvane::test::LoopDevice>(image());
        return ::mount(device_->name().c_str(), place().c_str(), "btrfs", MS_NOATIME, nullptr) == 0;
    }
    // Not only detached: the image is at rest when it is read or damaged.
    void unmount()
    {
        for (int tries = 0; tries < 250 && ::umount(place().c_str()) != 0 && errno == EBUSY;
             ++tries)
            ::usleep(20'000);
        ::umount2(place().c_str(), MNT_DETACH);
        device_.reset();
    }

    /// Of two copies the second.
    void damage(std::string_view text)
    {
        unmount();
        const std::size_t at = contentsOf(image()).rfind(text);
        ASSERT_NE(at, std::string::npos);
        std::fstream(image(), std::ios::in | std::ios::out).seekp(std::streamoff(at)) << '#';
        ASSERT_TRUE(mount());
    }

    /// The kernel then takes many seconds to read it.
    bool slowDown() const
    {
        for (const auto& volume : fs::directory_iterator("/sys/fs/btrfs")) {
            const fs::path disk = volume.path() / "devinfo/1";
            std::error_code error;
            if (fs::exists(volume.path() / "devices" / fs::path(device_->name()).filename(), error))
                return static_cast<bool>(std::ofstream(disk / "scrub_speed_max") << "1m\n"
                                                                                 << std::flush);
        }
        return false;
    }

    bool isScrubbed() const
    {
        const auto volume = MountedBtrfs::open(place());
        return volume->scrubbedBytes().has_value();
    }

    fs::path image() const { return directory_.path("image"); }
    fs::path place() const { return directory_.path("home"); }
    contract::DiskReferencePointer disk() const
    {
        return test::reference(device_->name(), "btrfs");
    }
    std::unique_ptr<test::JobFixture> library() const
    {
        return std::make_unique<test::JobFixture>(test::with(&JobOptions::homeDirectory, place()));
    }

    test::TestDirectory directory_;
    /// btrfs-scrub(8) keeps by it what it has found in a volume. Another process may run a test.
    const std::string uuid_ =
        "5c7b0000-0000-4000-8000-" + std::to_string(100'000'000'000 + ::getpid());
    std::unique_ptr<orvane::test::LoopDevice> device_;
};

TEST_F(LiveVerify, FindsDamageAndWritesNothing)
{
    for (const auto& [text, says] : {std::pair(std::string_view(), "no damage was found"),
                                     {leafText, "has another, good copy"},
                                     {fileText, "blocks without any good copy: 1;"}}) {
        if (!text.empty())
            damage(text);
        const std::string before = settledContents();
        const auto library = this->library();
        EXPECT_EQ(library->verify(disk()), 0);
        EXPECT_EQ(library->listener.verdict, text.empty() ? "sound" : "damaged");
        EXPECT_TRUE(test::contains(library->listener.message, says)) << library->listener.message;
        EXPECT_TRUE(contentsOf(image()) == before) << says;
        EXPECT_FALSE(mountsOf(fs::path(device_->name()), {}).empty()) << "it stays mounted";
    }
}

TEST_F(LiveVerify, IsStoppedInTheKernelTooAndLeavesTheScrubOfOthersAlone)
{
    if (!slowDown())
        GTEST_SKIP() << "this kernel's scrub cannot be slowed down, so it is over at once";
    const auto first = library();
    ASSERT_EQ(first->tool->beginStoragesystemFilesystemVerifyForDisk(disk()), 0);
    ASSERT_TRUE(first->loop.runUntil([&] { return !first->listener.progress.empty(); }));
    const auto second = library();
    second->verify(disk());
    EXPECT_EQ(second->listener.verdict, "failed");
    EXPECT_TRUE(test::contains(second->listener.message, "another program is checking"));
    EXPECT_TRUE(isScrubbed());
    first->tool->cancelCurrentOperation();
    ASSERT_TRUE(first->loop.runUntil([&] { return first->listener.finished == 1; }));
    EXPECT_EQ(first->listener.verdict, "stopped");
    EXPECT_FALSE(isScrubbed());
}

TEST_F(LiveVerify, IsNotForAVolumeThatCanBeUnmounted)
{
    test::JobFixture library;
    library.verify(disk());
    EXPECT_EQ(library.listener.verdict, "sound") << library.listener.message;
    EXPECT_TRUE(library.listener.hasPlainLine("no error found")) << "as btrfs check ends";
    EXPECT_FALSE(mountsOf(fs::path(device_->name()), {}).empty());
}

}  // namespace
