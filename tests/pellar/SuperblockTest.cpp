// SPDX-License-Identifier: Apache-2.0
//
// What is read of a disk before a tool may touch it. That volumes of their makers are read rightly
// is proven with the real tools; here stands what no maker makes.

#include "pellar/tools/ToolTable.h"
#include "tests/pellar/JobFixture.h"
#include "tests/support/VolumeStates.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/mman.h>
#include <unistd.h>

#include <fstream>
#include <map>
#include <random>

namespace {

using namespace pellar;
using orvane::test::Patch;

constexpr std::uint64_t mebibyte = 1U << 20U;

/// A disk of zeros but for these bytes.
VolumeFacts examined(std::string_view filesystem, const std::vector<Patch>& patches,
                     std::uint64_t bytes = 80 * mebibyte)
{
    const FileDescriptor disk(::memfd_create("disk", MFD_CLOEXEC));
    EXPECT_EQ(::ftruncate(disk.get(), static_cast<off_t>(bytes)), 0);
    for (const Patch& patch : patches)
        EXPECT_GT(::pwrite(disk.get(), patch.bytes.data(), patch.bytes.size(),
                           static_cast<off_t>(patch.offset)),
                  0);
    return toolFor(filesystem)->examine(disk.get(), 0, bytes);
}

VolumeFacts examined(std::string_view filesystem, const std::filesystem::path& image)
{
    const FileDescriptor disk(::open(image.c_str(), O_RDONLY | O_CLOEXEC));
    return toolFor(filesystem)->examine(disk.get(), 0, std::filesystem::file_size(image));
}

TEST(Superblocks, EveryFieldOfAFatBootSectorHasToMakeSense)
{
    // 20 MiB of FAT16, as mkfs.fat makes it.
    const std::vector<Patch> sound{
        {0, {"\xEB\x3C\x90mkfs.fat\0\2\4\4\0\2\0\2\0\xA0\xF8\x28\0", 24}}, {510, "\x55\xAA"}};
    EXPECT_TRUE(examined("vfat", sound).isRecognized);
    EXPECT_EQ(examined("vfat", sound).volumeBytes, 20 * mebibyte);
    for (const Patch& patch : {Patch{0, "\xFA"},           // no jump: the loader of an MBR
                               Patch{11, {"\0\0", 2}},     // sectors of no size
                               Patch{11, "\x01\x02"},      // sectors of 513 bytes
                               Patch{13, {"\0", 1}},       // clusters of no size
                               Patch{13, "\x03"},          // clusters of three sectors
                               Patch{14, {"\0\0", 2}},     // no room for itself
                               Patch{16, "\x07"},          // seven tables
                               Patch{19, {"\x10\0", 2}},   // shorter than its tables
                               Patch{21, "\x12"},          // no medium that there ever was
                               Patch{510, "\xAA\x55"}}) {  // no signature
        std::vector<Patch> patches = sound;
        patches.push_back(patch);
        EXPECT_FALSE(examined("vfat", patches).isRecognized) << patch.offset;
    }
}

TEST(Superblocks, BelongWhereTheyStand)
{
    for (const std::uint64_t place : {64U << 10U, 64U << 20U}) {
        const VolumeFacts facts = examined(
            "btrfs",
            {{place + 64, "_BHRfS_M"}, {place + 48, {"\0\0\1\0\0\0\0\0", 8}}, {place + 136, "\1"}});
        EXPECT_EQ(facts.isRecognized, place == 64U << 10U) << "a copy of something else's first";
    }
}

TEST(Superblocks, HugeNumbersDoNotWrapAround)
{
    const std::string greatest(8, '\xFF');
    const std::map<std::string_view, std::vector<Patch>> volumes{
        {"xfs", {{0, {"XFSB\0\0\x10\0", 8}}, {8, greatest}, {84, greatest.substr(4)}}},
        {"ntfs", {{3, {"NTFS    \0\2\x08", 11}}, {40, greatest}, {47, "\x7F"}, {64, "\xF6"}}},
        {"ext4",
         {{1024 + 0x38, "\x53\xEF"},
          {1024 + 0x60, "\x80"},
          {1024 + 0x18, "\x06"},
          {1024 + 0x04, greatest.substr(4)},
          {1024 + 0x150, greatest.substr(4)}}}};
    for (const auto& [filesystem, patches] : volumes) {
        const VolumeFacts facts = examined(filesystem, patches);
        EXPECT_TRUE(facts.isRecognized) << filesystem;
        EXPECT_EQ(facts.volumeBytes, ~std::uint64_t{0}) << filesystem;
    }
}

TEST(Superblocks, ALostOneOfExtIsFoundInItsFirstBackup)
{
    const test::TestDirectory workshop;
    for (const auto& [blockBytes, bytes] :
         {std::pair("1024", 16 * mebibyte), {"2048", 64 * mebibyte}, {"4096", 256 * mebibyte}}) {
        const auto image = workshop.makeExt("a", bytes, {"-b", blockBytes});
        EXPECT_TRUE(examined("ext4", image).hasPrimary) << blockBytes;
        std::fstream(image, std::ios::in | std::ios::out).seekp(1024 + 4) << '\1';
        const VolumeFacts facts = examined("ext4", image);
        EXPECT_TRUE(facts.isRecognized && !facts.hasPrimary) << "the checksum no longer fits";
        EXPECT_EQ(facts.volumeBytes, bytes) << blockBytes;
    }
}

TEST(Superblocks, WhatIsNoneOfExtIsRefused)
{
    const test::TestDirectory workshop;
    for (const auto& [offset, byte] : {std::pair(1024 + 0x18, '\x07'), {1024 + 0x38, '\x52'}}) {
        const auto image = workshop.makeExt("a", 4 * mebibyte, {"-O", "^metadata_csum"});
        std::fstream(image, std::ios::in | std::ios::out).seekp(offset) << byte;
        EXPECT_FALSE(examined("ext4", image).isRecognized) << offset;
    }
    EXPECT_FALSE(examined("ext4", {{1024 + 0x38, "\x53\xEF"}}, 2000).isRecognized) << "too short";
}

/// Damages the places that are read, and a few more, at random.
TEST(Superblocks, AnyBytesAreExamined)
{
    std::mt19937 random(7);
    const test::TestDirectory workshop;
    for (const auto& maker : orvane::test::volumeMakers()) {
        const auto image = workshop.makeVolume("disk", maker.filesystem);
        if (image.empty())
            continue;
        const FileDescriptor disk(::open(image.c_str(), O_RDWR | O_CLOEXEC));
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
