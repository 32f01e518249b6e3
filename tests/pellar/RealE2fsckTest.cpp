// SPDX-License-Identifier: Apache-2.0
//
// The real e2fsck on real volumes, damaged on purpose. Without root.

#include "contract/pellar/ErrorCodes.h"
#include "tests/pellar/Workshop.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <fstream>
#include <random>

namespace {

using namespace pellar;

std::string bytesOf(const std::filesystem::path& path)
{
    std::string bytes(std::filesystem::file_size(path), '\0');
    std::ifstream(path, std::ios::binary)
        .read(bytes.data(), static_cast<std::streamsize>(bytes.size()));
    return bytes;
}

/// A volume with a few files in it.
std::filesystem::path makeVolume(const test::Workshop& workshop, std::vector<std::string> options)
{
    const auto image = workshop.makeExt("disk", 16U << 20U, std::move(options));
    workshop.write("content", std::string(3000, 'x'));
    for (int i = 0; i < 8; ++i)
        workshop.damage(image,
                        "write " + workshop.path("content").string() + " f" + std::to_string(i));
    return image;
}

struct Damage {
    std::vector<std::string> commands;  ///< of debugfs
    std::string_view because;
};

const std::vector<Damage> repairable{
    {{"set_super_value free_blocks_count 1"}, "a count that -n reports with exit 0"},
    {{"clri f3"}, "a name without its file"},
    {{"set_inode_field f5 links_count 9"}, "a wrong count of links"},
    {{"unlink f4"}, "a file without a name"},
    {{"clri f1", "unlink f2", "set_super_value free_inodes_count 3"}, "all sorts"},
};

TEST(RealE2fsck, FindsDamageAndRepairsIt)
{
    for (const Damage& damage : repairable) {
        const test::Workshop workshop;
        const auto image = makeVolume(workshop, {});
        const auto disk = test::reference(image);
        test::Bench bench;
        ASSERT_EQ(bench.verify(disk), 0);
        EXPECT_EQ(bench.listener.verdict, "sound") << "before: " << damage.because;
        EXPECT_TRUE(bench.listener.hasPlainLine("The volume “Disk” appears to be OK.\n"));

        for (const std::string& command : damage.commands)
            workshop.damage(image, command);
        const std::string before = bytesOf(image);
        ASSERT_EQ(bench.verify(disk), 0);
        EXPECT_EQ(bench.listener.verdict, "damaged") << damage.because;
        EXPECT_EQ(bench.listener.error, contract::kPLErrorDamaged);
        EXPECT_FALSE(bench.listener.textsOf(contract::kFsckError).empty()) << damage.because;
        EXPECT_TRUE(bytesOf(image) == before) << "a verification wrote: " << damage.because;

        ASSERT_EQ(bench.repair(disk), 0);
        EXPECT_EQ(bench.listener.verdict, "repaired") << damage.because;
        EXPECT_EQ(bench.listener.error, contract::kPLNoError);
        ASSERT_EQ(bench.verify(disk), 0);
        EXPECT_EQ(bench.listener.verdict, "sound") << "after: " << damage.because;
        EXPECT_EQ(bench.listener.finished, 4);
    }
}

TEST(RealE2fsck, UnreplayedJournalIsInconclusiveUntilRepaired)
{
    const test::Workshop workshop;
    const auto image = makeVolume(workshop, {});
    workshop.damage(image, "feature needs_recovery");
    test::Bench bench;
    ASSERT_EQ(bench.verify(test::reference(image)), 0);
    EXPECT_EQ(bench.listener.error, contract::kPLErrorInconclusive);
    ASSERT_EQ(bench.repair(test::reference(image)), 0);
    EXPECT_EQ(bench.listener.verdict, "repaired");
    EXPECT_EQ(bench.listener.message,
              "repaired “Disk”: its journal was replayed; nothing else was wrong");
}

TEST(RealE2fsck, WorksOnARegionAndTouchesNothingBesides)
{
    const test::Workshop workshop;
    const auto volume = makeVolume(workshop, {});
    workshop.damage(volume, "set_super_value free_blocks_count 1");
    const std::string margin(1U << 20U, 'm');
    workshop.write("whole", margin + bytesOf(volume) + margin);
    auto region = *test::reference(workshop.path("whole"), "");
    region.offset = margin.size();
    region.length -= 2 * margin.size();
    const auto disk = std::make_shared<contract::DiskReference>(region);
    test::Bench bench;
    ASSERT_EQ(bench.verify(disk), 0);
    EXPECT_EQ(bench.listener.verdict, "damaged");
    ASSERT_EQ(bench.repair(disk), 0);
    EXPECT_EQ(bench.listener.verdict, "repaired");
    EXPECT_TRUE(bench.listener.hasPlainLine("Disk: "));
    EXPECT_FALSE(bench.listener.hasPlainLine("/proc/self")) << "our name for the disk is shown";
    const std::string whole = bytesOf(workshop.path("whole"));
    EXPECT_TRUE(whole.starts_with(margin) && whole.ends_with(margin));
}

TEST(RealE2fsck, WillNotRepairAVolumeWhoseEndIsMissing)
{
    const test::Workshop workshop;
    const auto image = makeVolume(workshop, {});
    std::filesystem::resize_file(image, 8U << 20U);
    const std::string before = bytesOf(image);
    test::Bench bench;
    ASSERT_EQ(bench.verify(test::reference(image)), 0);
    EXPECT_EQ(bench.listener.verdict, "damaged");
    EXPECT_TRUE(bench.listener.hasErrorWith("The volume is cut short"));
    EXPECT_EQ(bench.listener.error, contract::kPLErrorCutShort) << "nobody is sent to a repair";
    EXPECT_FALSE(bench.listener.hasPlainLine("needs to be repaired."));
    ASSERT_EQ(bench.repair(test::reference(image)), 0);
    EXPECT_EQ(bench.listener.error, contract::kPLErrorCutShort) << "nor called damaged after a repair";
    EXPECT_TRUE(bytesOf(image) == before) << "something was written";
}

// What a repair costs is said where everybody sees it, in numbers that are true.
TEST(RealE2fsck, SaysWhatARepairHasCost)
{
    struct Loss {
        std::vector<std::string> commands;
        std::size_t overwritten;  ///< of the inode table, with nonsense
        std::string_view message;
        std::string_view because;
    };
    for (const Loss& loss :
         {Loss{{}, 300U << 10U, "no damage is left, but 8 of 19 files are gone", "all of them"},
          Loss{{"clri f3"}, 0, "no damage is left, but 1 of 19 files is gone", "one"},
          Loss{{"unlink f3", "unlink f4"},
               0,
               "no damage is left; 2 files are now in lost+found",
               "without names"},
          Loss{{"set_super_value free_inodes_count 3"},
               0,
               "no damage is left",
               "a wrong count loses nothing"}}) {
        const test::Workshop workshop;
        // From e2fsprogs 1.47.1 on a new volume has one inode more, of the orphan file.
        const auto image = makeVolume(workshop, {"-b", "1024", "-O", "^orphan_file"});
        for (const std::string& command : loss.commands)
            workshop.damage(image, command);
        if (loss.overwritten > 0) {
            std::fstream file(image, std::ios::in | std::ios::out | std::ios::binary);
            file.seekp(134 << 10) << std::string(loss.overwritten, '\xA5');
        }
        test::Bench bench;
        ASSERT_EQ(bench.repair(test::reference(image)), 0);
        EXPECT_EQ(bench.listener.message, "repaired “Disk”: " + std::string(loss.message));
        const auto warnings = bench.listener.textsOf(contract::kFsckFail);
        EXPECT_EQ(warnings.empty(), loss.message == "no damage is left") << loss.because;
        EXPECT_TRUE(warnings.empty() || warnings.front() == bench.listener.message);
    }
}

TEST(RealE2fsck, SavesAVolumeByItsBackupSuperblock)
{
    const test::Workshop workshop;
    const auto image = makeVolume(workshop, {"-b", "1024"});
    {
        std::fstream file(image, std::ios::in | std::ios::out | std::ios::binary);
        file.seekp(1024) << std::string(1024, '\0');
    }
    test::Bench bench;
    ASSERT_EQ(bench.verify(test::reference(image, "")), 0);
    EXPECT_EQ(bench.listener.verdict, "damaged");
    ASSERT_EQ(bench.repair(test::reference(image, "")), 0);
    EXPECT_EQ(bench.listener.verdict, "repaired");
}

TEST(RealE2fsck, SaysWhatIsNoFileSystem)
{
    const test::Workshop workshop;
    std::string noise(1U << 20U, '\0');
    std::generate(noise.begin(), noise.end(),
                  [random = std::mt19937(1)]() mutable { return static_cast<char>(random()); });
    workshop.write("noise", noise);
    workshop.write("empty", {});
    workshop.write("tiny", "x");
    struct Case {
        std::string_view name;
        std::string filesystem;
        contract::ErrorCode error;
    };
    for (const Case& c : {Case{"noise", "", contract::kPLErrorUnsupported},
                          Case{"empty", "ext4", contract::kPLErrorUnsupported},
                          Case{"tiny", "", contract::kPLErrorUnsupported},
                          Case{"noise", "ext4", contract::kPLErrorDamaged}}) {
        test::Bench bench;
        ASSERT_EQ(bench.verify(test::reference(workshop.path(c.name), c.filesystem)), 0);
        EXPECT_EQ(bench.listener.error, c.error) << c.name << c.filesystem;
        EXPECT_NE(bench.listener.message.find("“Disk”"), std::string::npos);
    }
}

TEST(RealE2fsck, WritesNoExtOverAnotherKind)
{
    const test::Workshop workshop;
    const auto image = workshop.makeExt("disk", 16U << 20U, {"-b", "1024"});
    {
        // Made into a swap area, as mkswap(8) would: the backup superblocks are still there.
        std::fstream file(image, std::ios::in | std::ios::out | std::ios::binary);
        file << std::string(4096, '\0');
        file.seekp(1024) << std::string("\x01\0\0\0\xFF\x0F\0\0", 8);
        file.seekp(4086) << "SWAPSPACE2";
    }
    const std::string before = bytesOf(image);
    test::Bench bench;
    ASSERT_EQ(bench.repair(test::reference(image)), 0);
    EXPECT_EQ(bench.listener.error, contract::kPLErrorUnsupported);
    EXPECT_TRUE(bytesOf(image) == before) << "something was written";
}

TEST(RealE2fsck, LabelsCannotSpeak)
{
    const test::Workshop workshop;
    const auto image = makeVolume(workshop, {"-O", "^metadata_csum"});
    {
        std::fstream file(image, std::ios::in | std::ios::out | std::ios::binary);
        file.seekp(1024 + 0x78) << "\x1b[31m\nFix? no\n%@";
    }
    test::Bench bench;
    ASSERT_EQ(bench.verify(test::reference(image, "ext4", "\x1b[31mbad\n%1$@")), 0);
    EXPECT_EQ(bench.listener.verdict, "sound");
    for (const std::string& line : bench.listener.plainLines) {
        EXPECT_EQ(line.find('\x1b'), std::string::npos) << line;
        EXPECT_EQ(line.find("[31m"), std::string::npos) << line;
        EXPECT_EQ(line.find('\n'), line.size() - 1) << line;
    }
}

TEST(RealE2fsck, StopsWhenAsked)
{
    const test::Workshop workshop;
    const auto image = workshop.makeExt(
        "disk", 24ULL << 30U,
        {"-O", "^metadata_csum,^uninit_bg", "-N", "6000000", "-E", "lazy_itable_init=0"});
    test::Bench bench;
    bench.listener.onMessage = [&bench] {
        if (bench.listener.hasPlainLine("e2fsck 1"))
            bench.tool->cancelCurrentOperation();
    };
    ASSERT_EQ(bench.verify(test::reference(image)), 0);
    EXPECT_EQ(bench.listener.error, contract::kPLErrorCancelled);
    EXPECT_FALSE(bench.listener.hasPlainLine("appears to be OK."));
}

}  // namespace
