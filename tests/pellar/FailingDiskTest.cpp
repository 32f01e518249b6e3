// SPDX-License-Identifier: Apache-2.0
//
// The real tools on a disk of which places cannot be read.

#include "contract/pellar/ErrorCodes.h"
#include "pellar/process/FileDescriptor.h"
#include "tests/pellar/partitions/DiskMaker.h"

#define FUSE_USE_VERSION 312
#include <fcntl.h>
#include <fuse3/fuse.h>
#include <gtest/gtest.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>
#include <atomic>
#include <cerrno>
#include <cstdint>
#include <filesystem>
#include <stdexcept>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include <algorithm>

namespace {

using namespace pellar;

/// A file that fails on demand: it shows what is in another file, but for places that answer with
/// an I/O error. Needs root and /dev/fuse. Until this object ends it is served by a thread.
class FailingDisk {
public:
    struct Bad {
        std::uint64_t start = 0;
        std::uint64_t end = 0;  ///< the first good byte behind it
    };
    /// From when on the places are bad.
    enum class Since { Ever, FirstWrite };

    /// Mounts at `directory`, which is there and empty.
    FailingDisk(std::filesystem::path directory, const std::filesystem::path& backing,
                std::vector<Bad> bad, Since since = Since::Ever)
        : directory_(std::move(directory)),
          backing_(::open(backing.c_str(), O_RDWR | O_CLOEXEC)),
          bad_(std::move(bad)),
          since_(since)
    {
        static const fuse_operations table = operations();
        std::string program = "failing-disk";
        char* arguments[]{program.data(), nullptr};
        fuse_args list = FUSE_ARGS_INIT(1, arguments);
        fuse_ = ::fuse_new(&list, &table, sizeof table, this);
        ::fuse_opt_free_args(&list);
        if (!backing_ || fuse_ == nullptr || ::fuse_mount(fuse_, directory_.c_str()) != 0)
            throw std::runtime_error("cannot prepare the test: no FUSE file system can be mounted");
        server_ = std::thread([this] { ::fuse_loop(fuse_); });
    }
    FailingDisk(const FailingDisk&) = delete;
    FailingDisk& operator=(const FailingDisk&) = delete;
    ~FailingDisk()
    {
        ::umount2(directory_.c_str(), MNT_DETACH);  // which ends the serving
        server_.join();
        ::fuse_unmount(fuse_);
        ::fuse_destroy(fuse_);
    }

    /// Why there can be none here; empty where there can.
    static std::string obstacle()
    {
        if (::geteuid() != 0)
            return "needs root, to mount a FUSE file system";
        return ::access("/dev/fuse", R_OK | W_OK) == 0 ? "" : "needs /dev/fuse";
    }

    std::filesystem::path path() const { return directory_ / "disk"; }
    bool wasWritten() const { return wasWritten_; }

private:
    static FailingDisk& own()
    {
        return *static_cast<FailingDisk*>(::fuse_get_context()->private_data);
    }
    static fuse_operations operations()
    {
        fuse_operations table = {};
        table.getattr = [](const char* path, struct stat* status, fuse_file_info*) {
            const bool isDirectory = std::string_view(path) == "/";
            if (!isDirectory && std::string_view(path) != "/disk")
                return -ENOENT;
            if (!isDirectory)
                return ::fstat(own().backing_.get(), status) == 0 ? 0 : -errno;
            status->st_mode = S_IFDIR | 0777;
            status->st_nlink = 2;
            return 0;
        };
        table.read = [](const char*, char* bytes, std::size_t count, off_t start, fuse_file_info*) {
            if (own().isBad(static_cast<std::uint64_t>(start), count))
                return -EIO;
            return static_cast<int>(::pread(own().backing_.get(), bytes, count, start));
        };
        table.write = [](const char*, const char* bytes, std::size_t count, off_t start,
                         fuse_file_info*) {
            own().wasWritten_ = true;
            return static_cast<int>(::pwrite(own().backing_.get(), bytes, count, start));
        };
        return table;
    }
    bool isBad(std::uint64_t start, std::uint64_t bytes) const
    {
        if (since_ == Since::FirstWrite && !wasWritten_)
            return false;
        return std::any_of(bad_.begin(), bad_.end(), [&](const Bad& bad) {
            return bad.start < start + bytes && start < bad.end;
        });
    }

    std::filesystem::path directory_;
    pellar::FileDescriptor backing_;
    fuse* fuse_ = nullptr;
    std::vector<Bad> bad_;
    Since since_;
    std::atomic<bool> wasWritten_ = false;
    std::thread server_;
};

/// Places of the volumes that `volumeMakers` make, and of an ext4 of 16 MiB.
struct BadPlace {
    std::string_view filesystem;
    FailingDisk::Bad bad;
    std::string_view because;
};

const std::vector<BadPlace> badPlaces{
    {"ext4", {134 << 10, 198 << 10}, "the inode table"},
    {"ext4", {0, 4096}, "the superblock"},
    {"ext4", {0, 16 << 20}, "all of it, which is no empty disk"},
    {"vfat", {2048, 6144}, "the first table"},
    {"vfat", {0, 512}, "the boot sector"},
    {"exfat", {2 << 20, (2 << 20) + 65536}, "the bitmap, of which it says no more than failed"},
    {"exfat", {0, 65536}, "the boot sector and its backup"},
    {"ntfs", {64 << 10, 128 << 10}, "it takes it for the end of the disk"},
    {"ntfs", {16 << 10, 20 << 10}, "the file table"},
    {"ntfs", {0, 4096}, "the boot sector, of which the backup is good"},
    {"xfs", {128 << 10, 192 << 10}, "the first group"},
    {"xfs", {0, 4096}, "the superblock"},
    {"btrfs", {64 << 10, 68 << 10}, "the superblock, of which the mirror is good"},
    {"btrfs", {20 << 20, 40 << 20}, "trees, with status 0 where a copy is good"},
    {"f2fs", {6 << 20, (6 << 20) + 65536}, "the segment table, an assertion to it"},
    {"f2fs", {0, 65536}, "both superblocks"},
};

class FailingDiskTest : public ::testing::Test {
protected:
    void SetUp() override
    {
        if (const std::string obstacle = FailingDisk::obstacle(); !obstacle.empty())
            GTEST_SKIP() << obstacle;
        std::filesystem::create_directory(directory_.path("mounted"));
    }

    /// None where the program that makes it is not installed.
    std::filesystem::path make(std::string_view filesystem) const
    {
        return filesystem == "ext4" ? makeExt() : directory_.makeVolume("backing", filesystem);
    }

    std::filesystem::path makeExt() const
    {
        const auto image = directory_.makeExt("backing", 16U << 20U, {"-b", "1024"});
        for (int i = 0; i < 40; ++i)
            directory_.damage(image, "mkdir d" + std::to_string(i));
        return image;
    }

    test::TestDirectory directory_;
};

void expectAdviceToCopy(const test::Listener& heard, std::string_view because)
{
    EXPECT_EQ(heard.verdict, "failed") << because << ": " << heard.message;
    EXPECT_EQ(heard.error, contract::kPLErrorUnreadable) << because;
    EXPECT_TRUE(test::contains(heard.message, "ddrescue")) << heard.message;
    EXPECT_FALSE(heard.hasPlainLine("needs to be repaired.")) << because;
}

TEST_F(FailingDiskTest, IsNeitherDamagedNorWrittenTo)
{
    enum class Way { Verify, Repair, TryARepair };
    for (const BadPlace& place : badPlaces)
        for (const Way way : {Way::Verify, Way::Repair, Way::TryARepair}) {
            const bool repairs = way != Way::Verify;
            const auto backing = make(place.filesystem);
            if (backing.empty())
                continue;
            // Not known by its label or kind, as a disk whose beginning cannot be read.
            const bool isListed = place.bad.start > 0;
            const FailingDisk failing(directory_.path("mounted"), backing, {place.bad});
            const auto disk = test::reference(
                failing.path(), isListed ? std::string(place.filesystem) : std::string());
            test::JobFixture library(
                way == Way::TryARepair ? test::tryingIn(directory_.path("repairs")) : JobOptions());
            ASSERT_EQ(repairs ? library.repair(disk) : library.verify(disk), 0);
            const std::string because =
                std::string(place.filesystem) + ", " + std::string(place.because);
            if (way == Way::Repair && place.filesystem == "btrfs" && isListed)
                EXPECT_EQ(library.listener.error, contract::kPLErrorNoRepairHere) << because;
            else
                expectAdviceToCopy(library.listener, because);
            EXPECT_FALSE(failing.wasWritten()) << because;
        }
}

// Nothing is restored over a copy that was only not to be read.
TEST_F(FailingDiskTest, IsNoDamagedPartitionMap)
{
    const auto backing = test::DiskImage::gpt(directory_, "backing").path();
    for (const FailingDisk::Bad bad :
         {FailingDisk::Bad{0, 512}, FailingDisk::Bad{32735 * 512, 32768 * 512}})
        for (const bool repairs : {false, true}) {
            const FailingDisk failing(directory_.path("mounted"), backing, {bad});
            const auto whole = test::wholeDisk(failing.path());
            test::JobFixture library;
            ASSERT_EQ(library.finish(repairs ? library.tool->beginPartitionMapRepairForDisk(whole)
                                             : library.tool->beginPartitionMapVerifyForDisk(whole)),
                      0);
            expectAdviceToCopy(library.listener, "a copy of the partition map");
            EXPECT_FALSE(failing.wasWritten());
        }
}

// e2fsck -n never reads them, e2fsck -y would answer each question of theirs with yes.
TEST_F(FailingDiskTest, WhatOnlyARepairReadsIsReadBeforeIt)
{
    const auto backing = make("ext4");
    directory_.damage(backing, "set_super_value free_blocks_count 1");
    const FailingDisk failing(directory_.path("mounted"), backing, {{8193 << 10, 8195 << 10}});
    test::JobFixture library;
    ASSERT_EQ(library.repair(test::reference(failing.path())), 0);
    expectAdviceToCopy(library.listener, "a backup of the superblock");
    EXPECT_TRUE(test::contains(library.listener.message, "byte 8388608 "))
        << library.listener.message;
    EXPECT_FALSE(failing.wasWritten());
}

TEST_F(FailingDiskTest, EndsARepairThatMeetsItOnTheWay)
{
    const auto backing = make("ext4");
    directory_.damage(backing, "feature needs_recovery");
    directory_.damage(backing, "clri d7");
    const FailingDisk failing(directory_.path("mounted"), backing, {{134 << 10, 646 << 10}},
                              FailingDisk::Since::FirstWrite);
    test::JobFixture library;
    ASSERT_EQ(library.repair(test::reference(failing.path())), 0);
    EXPECT_TRUE(failing.wasWritten()) << "it began";
    expectAdviceToCopy(library.listener, "it failed while it was being repaired");
    EXPECT_EQ(std::count_if(library.traces.begin(), library.traces.end(),
                            [](const std::string& line) { return line.starts_with("run: "); }),
              2)
        << "nothing more is asked of the disk";
}

}  // namespace
