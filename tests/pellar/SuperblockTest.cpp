// SPDX-License-Identifier: Apache-2.0
//
// What is read of a disk before a tool may touch it. That it is read rightly is proven on real
// volumes; here stands what no maker makes.

#include "pellar/tools/FatBootSector.h"
#include "pellar/tools/ToolTable.h"
#include "pellar/tools/XfsSuperblock.h"
#include "pellar/tools/btrfs/BtrfsSuperblock.h"
#include "pellar/tools/ntfs/NtfsVolume.h"
#include "tests/pellar/Workshop.h"
#include "tests/support/VolumeStates.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <random>

namespace {

using namespace pellar;
using Sector = std::vector<std::uint8_t>;

void put(Sector& sector, std::size_t offset, std::string_view bytes)
{
    std::copy(bytes.begin(), bytes.end(), sector.begin() + static_cast<std::ptrdiff_t>(offset));
}

/// 20 MiB of FAT16, as mkfs.fat makes it.
Sector fatSector()
{
    Sector sector(512);
    put(sector, 0, std::string_view("\xEB\x3C\x90mkfs.fat\0\2\4\4\0\2\0\2\0\xA0\xF8\x28\0", 24));
    put(sector, 510, "\x55\xAA");
    return sector;
}

TEST(FatBootSector, EveryFieldHasToMakeSense)
{
    const auto read = parseFatBootSector(fatSector());
    ASSERT_TRUE(read);
    EXPECT_EQ(read->bits, 16);
    EXPECT_EQ(read->volumeBytes, 20U << 20U);
    struct Case {
        std::size_t offset;
        std::string_view bytes;
        std::string_view because;
    };
    for (const Case& c : {Case{0, "\xFA", "no jump: the loader of an MBR"},
                          Case{11, std::string_view("\0\0", 2), "sectors of no size"},
                          Case{11, "\x01\x02", "sectors of 513 bytes"},
                          Case{13, std::string_view("\0", 1), "clusters of no size"},
                          Case{13, "\x03", "clusters of three sectors"},
                          Case{14, std::string_view("\0\0", 2), "no room for itself"},
                          Case{16, "\x07", "seven tables"},
                          Case{19, std::string_view("\x10\0", 2), "shorter than its tables"},
                          Case{21, "\x12", "no medium that there ever was"},
                          Case{510, "\xAA\x55", "no signature"}}) {
        Sector sector = fatSector();
        put(sector, c.offset, c.bytes);
        EXPECT_FALSE(parseFatBootSector(sector)) << c.because;
    }
}

TEST(Superblocks, BelongWhereTheyStand)
{
    Sector block(4096);
    put(block, 64, "_BHRfS_M");
    put(block, 48, std::string_view("\0\0\1\0\0\0\0\0", 8));
    put(block, 136, "\1");
    EXPECT_TRUE(parseBtrfsSuperblock(block, 64U << 10U));
    EXPECT_FALSE(parseBtrfsSuperblock(block, 64U << 20U)) << "a copy of something else's first";
}

TEST(Superblocks, HugeNumbersDoNotWrapAround)
{
    Sector xfs(512);
    put(xfs, 0, std::string_view("XFSB\0\0\x10\0\xFF\xFF\xFF\xFF\xFF\xFF\xFF\xFF", 16));
    put(xfs, 84, "\xFF\xFF\xFF\xFF");
    ASSERT_TRUE(parseXfsSuperblock(xfs));
    EXPECT_EQ(parseXfsSuperblock(xfs)->volumeBytes, ~std::uint64_t{0});

    Sector ntfs(512);
    put(ntfs, 3, std::string_view("NTFS    \0\2\x08", 11));
    put(ntfs, 40, "\xFF\xFF\xFF\xFF\xFF\xFF\xFF\x7F");
    put(ntfs, 64, "\xF6");
    ASSERT_TRUE(parseNtfsBootSector(ntfs));
    EXPECT_EQ(parseNtfsBootSector(ntfs)->volumeBytes, ~std::uint64_t{0});
    EXPECT_EQ(parseNtfsBootSector(ntfs)->fileRecordBytes, 1024U);
}

/// Damages the places that are read, and a few more, at random.
TEST(Superblocks, AnyBytesAreExamined)
{
    std::mt19937 random(7);
    const test::Workshop workshop;
    for (const auto& maker : orvane::test::volumeMakers()) {
        if (findProgram(maker.command.front(), "/usr/sbin:/usr/bin").empty())
            continue;
        workshop.write("disk", {});
        std::filesystem::resize_file(workshop.path("disk"), maker.bytes);
        workshop.prepare(maker.command, workshop.path("disk"));
        const FileDescriptor disk(::open(workshop.path("disk").c_str(), O_RDWR | O_CLOEXEC));
        const Tool& tool = *toolFor(maker.filesystem);
        for (int i = 0; i < 2000; ++i) {
            const std::uint64_t places[] = {0, 1024, 16384, 16384 + 2048, 16384 + 3072, 65536};
            const auto place = places[random() % 6] + random() % 600;
            const auto byte = static_cast<char>(random());
            ASSERT_EQ(::pwrite(disk.get(), &byte, 1, static_cast<off_t>(place)), 1);
            const VolumeFacts facts = tool.examine(disk.get(), 0, maker.bytes);
            EXPECT_TRUE(facts.isRecognized || facts.isForeign)
                << "what is not known may be written to: " << maker.filesystem;
        }
        EXPECT_TRUE(tool.examine(disk.get(), maker.bytes - 100, 100).isForeign);
        EXPECT_TRUE(tool.examine(disk.get(), ~std::uint64_t{0} - 4096, 4096).isForeign);
    }
}

}  // namespace
