// SPDX-License-Identifier: Apache-2.0
//
// A disk that is written to without being written to.

#include "pellar/overlay/FullCopy.h"
#include "pellar/overlay/OverlayFile.h"
#include "tests/pellar/JobFixture.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sched.h>
#include <sys/prctl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <functional>
#include <random>

namespace {

using namespace pellar;
using orvane::test::contentsOf;
using test::TestDirectory;

constexpr std::uint64_t diskBytes = 200'000;
constexpr ByteRange region{1'000, 150'000};

class OverlayFixture {
public:
    explicit OverlayFixture(std::uint64_t mostBytes = ~std::uint64_t{0})
    {
        std::mt19937 random(1);
        std::string bytes(diskBytes, '\0');
        std::ranges::generate(bytes, [&] { return static_cast<char>(random()); });
        directory.write("disk", bytes);
        disk = FileDescriptor(::open(directory.path("disk").c_str(), O_RDONLY | O_CLOEXEC));
        overlay = *Overlay::over(disk.get(), region, {directory.path("room"), mostBytes});
        original = bytes.substr(region.offset, region.length);
    }

    std::string read(ByteRange range) const
    {
        Bytes bytes(range.length);
        EXPECT_EQ(overlay->read(range.offset, bytes), 0);
        return {bytes.begin(), bytes.end()};
    }

    int write(std::uint64_t place, std::string_view bytes) const
    {
        const auto* const first = reinterpret_cast<const std::uint8_t*>(bytes.data());
        return overlay->write(place, {first, bytes.size()});
    }

    TestDirectory directory;
    FileDescriptor disk;
    std::string original;  ///< of the region
    std::unique_ptr<Overlay> overlay;
};

TEST(Overlay, IsTheDiskWithWhatWasWrittenToIt)
{
    const OverlayFixture disk;
    std::mt19937 random(2);
    std::string expected = disk.original;
    std::vector<bool> isWritten(region.length);
    for (int i = 0; i < 2'000; ++i) {
        const std::uint64_t place = random() % region.length;
        const auto length = std::min<std::uint64_t>(random() % 3'000, region.length - place);
        // Half of what is written is what stands there already.
        std::string bytes = disk.original.substr(place, length);
        if (i % 2 == 0)
            std::ranges::generate(bytes, [&] { return static_cast<char>(random()); });
        ASSERT_EQ(disk.write(place, bytes), 0);
        expected.replace(place, length, bytes);
        std::fill_n(isWritten.begin() + static_cast<std::ptrdiff_t>(place), length, true);
        const std::uint64_t from = random() % region.length;
        const ByteRange looked{from, std::min<std::uint64_t>(5'000, region.length - from)};
        ASSERT_EQ(disk.read(looked), expected.substr(looked.offset, looked.length)) << i;
    }
    EXPECT_EQ(disk.read({0, region.length}), expected);
    EXPECT_EQ(disk.overlay->keptBytes(),
              static_cast<std::uint64_t>(std::ranges::count(isWritten, true)))
        << "a place that is written twice is kept once";
    std::string rebuilt = disk.original;
    std::uint64_t end = 0;
    const auto differences = disk.overlay->differences();
    ASSERT_TRUE(differences);
    for (const ByteRange& range : *differences) {
        EXPECT_GE(range.offset, end) << "in order, and never twice";
        end = range.end();
        rebuilt.replace(range.offset, range.length, expected, range.offset, range.length);
    }
    EXPECT_EQ(rebuilt, expected) << "the differences leave something out";
    EXPECT_EQ(contentsOf(disk.directory.path("disk")).substr(region.offset, region.length),
              disk.original);
}

TEST(Overlay, ReadsHolesAsZerosUpToTheirEnds)
{
    const TestDirectory directory;
    const auto image = directory.makeFile("disk", 400'000);
    orvane::test::patch(image, 131'072, "data");
    const FileDescriptor disk(::open(image.c_str(), O_RDONLY | O_CLOEXEC));
    const auto overlay = *Overlay::over(disk.get(), {4'096, 395'904}, {directory.path("room")});
    const auto read = [&](std::uint64_t place, std::size_t length) {
        Bytes bytes(length, 7);
        EXPECT_EQ(overlay->read(place, bytes), 0);
        return std::string(bytes.begin(), bytes.end());
    };
    EXPECT_EQ(read(0, 1'000), std::string(1'000, '\0'));
    EXPECT_EQ(read(126'000, 2'000).substr(976, 5), std::string("data\0", 5));
    EXPECT_EQ(read(394'904, 1'000), std::string(1'000, '\0'));
    EXPECT_EQ(read(126'976, 4), "data") << "after a hole behind it";
    std::filesystem::resize_file(image, 200'000);
    const auto shorter = *Overlay::over(disk.get(), {4'096, 395'904}, {directory.path("room")});
    Bytes bytes(512);
    EXPECT_EQ(shorter->read(300'000, bytes), EIO) << "behind the end is no hole";
}

TEST(Overlay, TellsOnlySectorsThatDiffer)
{
    const OverlayFixture disk;
    EXPECT_EQ(disk.write(0, disk.original), 0);
    EXPECT_TRUE(disk.overlay->differences()->empty());
    std::string sector = disk.original.substr(1024, 512);
    sector[5] = static_cast<char>(~sector[5]);
    EXPECT_EQ(disk.write(1024, sector), 0);
    EXPECT_EQ(*disk.overlay->differences(), (std::vector<ByteRange>{{1024, 512}}));
}

TEST(Overlay, KeepsNoMoreThanItMay)
{
    const OverlayFixture disk(4'096);
    EXPECT_EQ(disk.write(region.length - 10, std::string(11, 'x')), EFBIG);
    EXPECT_FALSE(disk.overlay->isOutOfRoom()) << "that was not for want of room";
    EXPECT_EQ(disk.write(0, std::string(4'096, 'x')), 0);
    EXPECT_EQ(disk.write(8'192, "y"), ENOSPC);
    EXPECT_TRUE(disk.overlay->isOutOfRoom());
    EXPECT_EQ(disk.write(0, std::string(4'096, 'z')), 0) << "in its place there is room";
    EXPECT_EQ(disk.read({8'192, 1}), disk.original.substr(8'192, 1));
}

TEST(Overlay, KnowsWhereTheDiskCannotBeRead)
{
    const OverlayFixture disk;
    std::filesystem::resize_file(disk.directory.path("disk"), region.offset + 100'000);
    Bytes bytes(512);
    EXPECT_EQ(disk.write(120'000, std::string(512, 'x')), 0);
    EXPECT_EQ(disk.overlay->read(120'000, bytes), 0) << "what was written is ours";
    EXPECT_EQ(disk.overlay->firstUnreadable(), std::nullopt);
    EXPECT_EQ(disk.overlay->read(110'000, bytes), EIO);
    EXPECT_EQ(disk.overlay->firstUnreadable(), 110'000U);
    EXPECT_FALSE(disk.overlay->differences()) << "nobody knows what stands below what was written";
}

// Holes are left out of it, and what is written into a hole, or over with zeros, is told.
TEST(FullCopy, IsTheImageWithWhatWasWrittenToIt)
{
    constexpr ByteRange part{4'096, 40U << 20U};
    const TestDirectory directory;
    const auto image = directory.makeFile("disk", 64U << 20U);
    orvane::test::patch(image, part.offset + (9U << 20U), std::string(5'000, 'x'));
    orvane::test::patch(image, 60U << 20U, "beyond");
    const std::string before = contentsOf(image);
    const FileDescriptor disk(::open(image.c_str(), O_RDONLY | O_CLOEXEC));
    const auto isStopped = [] {
        return false;
    };
    const auto copy = FullCopy::of(disk.get(), part, {directory.path("room")}, isStopped);
    ASSERT_TRUE(copy) << copy.error();
    EXPECT_TRUE((*copy)->differences()->empty());
    const int file = (*copy)->descriptor();
    EXPECT_EQ(::pwrite(file, "new", 3, 30 << 20), 3);
    EXPECT_EQ(::pwrite(file, std::string(600, '\0').data(), 600, 9 << 20), 600);
    EXPECT_EQ(*(*copy)->differences(),
              (std::vector<ByteRange>{{9U << 20U, 1'024}, {30U << 20U, 512}}));
    EXPECT_TRUE(contentsOf(image) == before);
    const auto tooLarge = FullCopy::of(disk.get(), part, {directory.path("room"), 100}, isStopped);
    EXPECT_TRUE(tooLarge || tooLarge.error() == ENOSPC) << "or its blocks are shared";
    const auto stopped =
        FullCopy::of(disk.get(), part, {directory.path("room")}, [] { return true; });
    EXPECT_TRUE(stopped || stopped.error() == ECANCELED);
}

constexpr const char* noNamespaces = "user namespaces are not to be had here";

/// An ordinary user needs a user namespace; nobody makes one behind a chroot (user_namespaces(7)).
bool canPresentAs(uid_t user)
{
    return user == 0 ||
           orvane::test::statusOfChild([] { return ::unshare(CLONE_NEWUSER) == 0 ? 0 : 1; }) == 0;
}

TEST(OverlayFile, IsOpenedByNameAsAnyUser)
{
    for (const uid_t user : {uid_t{0}, uid_t{65534}}) {
        if (::geteuid() != 0 && user != ::geteuid())
            continue;
        if (!canPresentAs(user))
            GTEST_SKIP() << noNamespaces;
        const OverlayFixture disk;
        // As a program that this user has started: the files of its process are its own.
        EXPECT_EQ(orvane::test::statusOfChild([&] {
                      if (::setresgid(user, user, user) != 0 ||
                          ::setresuid(user, user, user) != 0 || ::prctl(PR_SET_DUMPABLE, 1) != 0)
                          return 99;
                      const auto file = OverlayFile::present(*disk.overlay);
                      if (!file)
                          return file.error();
                      // The tool's own way: by the name of a descriptor that it inherits.
                      const FileDescriptor again(
                          ::open(pathOfDescriptor((*file)->descriptor()).c_str(), O_RDWR));
                      char bytes[4] = {};
                      const bool isUsable =
                          again && ::pwrite(again.get(), "abcd", 4, 4'000) == 4 &&
                          ::pread(again.get(), bytes, 4, 4'000) == 4 &&
                          std::string_view(bytes, 4) == "abcd" &&
                          ::lseek(again.get(), 0, SEEK_END) == static_cast<off_t>(region.length) &&
                          ::ftruncate(again.get(), 10) != 0;
                      return isUsable ? 0 : 1;
                  }),
                  0)
            << user;
        EXPECT_EQ(contentsOf("/proc/self/mountinfo").find("pellar-overlay"), std::string::npos);
    }
}

TEST(OverlayFile, LeavesOthersWithNothingAtItsEnd)
{
    if (!canPresentAs(::geteuid()))
        GTEST_SKIP() << noNamespaces;
    const OverlayFixture disk;
    auto file = OverlayFile::present(*disk.overlay);
    ASSERT_TRUE(file) << file.error();
    const FileDescriptor held(::dup((*file)->descriptor()));
    char byte = 0;
    ASSERT_EQ(::pread(held.get(), &byte, 1, 0), 1);
    file->reset();
    EXPECT_EQ(::pread(held.get(), &byte, 1, 100'000), -1);
    EXPECT_EQ(errno, ENOTCONN);
}

TEST(OverlayFile, PassesOnWhatCannotBeReadAndNoMore)
{
    if (!canPresentAs(::geteuid()))
        GTEST_SKIP() << noNamespaces;
    const OverlayFixture disk;
    std::filesystem::resize_file(disk.directory.path("disk"), region.offset + 102'400);
    const auto file = OverlayFile::present(*disk.overlay);
    ASSERT_TRUE(file);
    std::string bytes(120'000, '\0');
    const ssize_t count = ::pread((*file)->descriptor(), bytes.data(), bytes.size(), 0);
    EXPECT_EQ(count, 102'400) << "the last page before the place that cannot be read is read";
    EXPECT_EQ(bytes.substr(0, 102'400), disk.original.substr(0, 102'400));
    EXPECT_EQ(::pread((*file)->descriptor(), bytes.data(), 512, 110'000), -1);
    EXPECT_EQ(errno, EIO);
}

}  // namespace
