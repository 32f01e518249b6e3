// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/ext/ExtSuperblock.h"

#include "pellar/process/FileDescriptor.h"

#include "tests/pellar/Workshop.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <array>
#include <fstream>
#include <optional>

namespace {

using namespace pellar;

std::optional<ExtSuperblock> read(const std::filesystem::path& image, std::uint64_t offset = 0)
{
    const FileDescriptor disk(::open(image.c_str(), O_RDONLY | O_CLOEXEC));
    return readExtSuperblock(disk.get(), offset, std::filesystem::file_size(image) - offset);
}

void put(const std::filesystem::path& image, std::uint64_t offset, std::string_view bytes)
{
    std::fstream file(image, std::ios::in | std::ios::out | std::ios::binary);
    file.seekp(static_cast<std::streamoff>(offset)) << bytes;
}

TEST(ExtSuperblock, IsReadAsMke2fsWritesIt)
{
    const test::Workshop workshop;
    for (const std::vector<std::string>& options :
         {std::vector<std::string>{"-b", "1024"}, std::vector<std::string>{"-b", "4096"},
          std::vector<std::string>{"-O", "^metadata_csum,^64bit"}}) {
        const auto superblock = read(workshop.makeExt("a", 16U << 20U, options));
        ASSERT_TRUE(superblock);
        EXPECT_EQ(superblock->volumeBytes(), 16U << 20U);
        EXPECT_TRUE(superblock->hasJournal);
        EXPECT_FALSE(superblock->hasExternalJournal || superblock->needsRecovery ||
                     superblock->isBackup || superblock->isJournalDevice);
    }
}

TEST(ExtSuperblock, FallsBackToABackup)
{
    const test::Workshop workshop;
    struct Case {
        std::string blockBytes;
        std::uint64_t bytes;
    };
    for (const Case& c :
         {Case{"1024", 16U << 20U}, Case{"2048", 64U << 20U}, Case{"4096", 256U << 20U}}) {
        const auto image = workshop.makeExt("a", c.bytes, {"-b", c.blockBytes});
        put(image, 1024 + 4, "\x01");  // the checksum no longer fits
        const auto superblock = read(image);
        ASSERT_TRUE(superblock) << c.blockBytes;
        EXPECT_TRUE(superblock->isBackup) << c.blockBytes;
        EXPECT_EQ(superblock->volumeBytes(), c.bytes) << c.blockBytes;
    }
}

TEST(ExtSuperblock, RefusesWhatIsNone)
{
    const test::Workshop workshop;
    const auto image = workshop.makeExt("a", 4U << 20U, {"-O", "^metadata_csum"});
    struct Case {
        std::uint64_t offset;
        std::string_view bytes;
        std::string_view because;
    };
    for (const Case& c : {Case{1024 + 0x18, "\x07", "blocks of 128 KiB"},
                          Case{1024 + 0x38, "\x52", "another magic number"}}) {
        const auto copy = workshop.path("copy");
        std::filesystem::copy_file(image, copy, std::filesystem::copy_options::overwrite_existing);
        put(copy, c.offset, c.bytes);
        EXPECT_FALSE(read(copy)) << c.because;
    }
    workshop.write("short", std::string(2000, 'x'));
    EXPECT_FALSE(read(workshop.path("short")));
}

TEST(ExtSuperblock, SizeDoesNotOverflow)
{
    std::array<std::uint8_t, ExtSuperblock::size> bytes{};
    bytes[0x38] = 0x53;
    bytes[0x39] = 0xEF;
    bytes[0x60] = 0x80;  // 64bit
    bytes[0x18] = 6;
    for (const std::size_t field : {0x04, 0x150})
        std::fill_n(bytes.begin() + static_cast<std::ptrdiff_t>(field), 4, 0xFF);
    ASSERT_TRUE(parseExtSuperblock(bytes));
    EXPECT_EQ(parseExtSuperblock(bytes)->volumeBytes(), ~0ULL);
}

}  // namespace
