// SPDX-License-Identifier: Apache-2.0
// The example module: what a scan counts and what it leaves alone, and what the tab makes of it.
#include "DirectoryScan.h"
#include "DiskUsage.h"
#include "tests/module/FakeHost.h"
#include "tests/support/TestDirectory.h"

#include <gtest/gtest.h>

#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <fstream>

namespace diskusage {
namespace {

namespace fs = std::filesystem;
using orvane::test::TestDirectory;

constexpr std::size_t kibibyte = 1024;

bool always(const ScanProgress&)
{
    return true;
}

ScanResult scan(const fs::path& directory, const ScanLimits& limits = {})
{
    return scanDirectory(directory, limits, always);
}

std::vector<std::string> namesOf(const ScanResult& result)
{
    std::vector<std::string> names;
    for (const TopEntry& entry : result.largest)
        names.push_back(entry.name);
    return names;
}

TEST(DirectoryScan, CountsWhatIsOnTheDiskOnceAndFollowsNoLink)
{
    const TestDirectory directory;
    orvane::test::write(directory / "top/large/below/file", std::string(400 * kibibyte, 'x'));
    orvane::test::write(directory / "top/small", std::string(40 * kibibyte, 'x'));
    orvane::test::write(directory / "outside/file", std::string(900 * kibibyte, 'x'));
    fs::create_symlink("../outside", directory / "top/to-a-folder");
    fs::create_symlink("../outside/file", directory / "top/to-a-file");
    fs::create_symlink(".", directory / "top/large/circle");
    fs::create_hard_link(directory / "top/small", directory / "top/large/small-again");
    fs::resize_file(directory.makeFile("top/sparse", 1), 1U << 30U);

    const ScanResult result = scan(directory / "top");
    EXPECT_EQ(result.end, ScanResult::End::Complete);
    EXPECT_EQ(namesOf(result).front(), "large");
    EXPECT_GE(result.bytes, 440 * kibibyte);
    EXPECT_LT(result.bytes, 475 * kibibyte) << "a link was followed, or a file counted twice";
    EXPECT_EQ(result.unreadable, 0U);
}

TEST(DirectoryScan, NamesTheLargestAndAddsUpTheRest)
{
    const TestDirectory directory;
    for (std::size_t i = 0; i < 300; ++i)
        orvane::test::write(directory / ("top/" + std::to_string(i)),
                            std::string((i == 77 ? 64 : 4) * kibibyte, 'x'));
    const ScanResult result = scan(directory / "top", {.told = 3});
    EXPECT_EQ(result.largest.size(), 3U);
    EXPECT_EQ(result.largest.front().name, "77");
    EXPECT_EQ(result.otherEntries, 297U);
    std::uint64_t sum = result.otherBytes;
    for (const TopEntry& entry : result.largest)
        sum += entry.bytes;
    EXPECT_EQ(sum, result.bytes);
}

TEST(DirectoryScan, DoesNotEnterWhatIsMountedBelow)
{
    std::ifstream mounts("/proc/self/mounts");
    const std::string all{std::istreambuf_iterator<char>(mounts), {}};
    if (all.find(" /dev/shm ") == std::string::npos && all.find(" /dev/pts ") == std::string::npos)
        GTEST_SKIP() << "nothing is mounted below /dev here";
    const ScanResult result = scan("/dev");
    EXPECT_GE(result.otherMounts, 1U);
    EXPECT_EQ(std::ranges::count(namesOf(result), "pts"), 0);
}

TEST(DirectoryScan, EndsWhereItIsTold)
{
    const TestDirectory directory;
    fs::path deep = directory / "top";
    for (int i = 0; i < 40; ++i)
        deep /= "d";
    orvane::test::write(deep / "file", "x");
    EXPECT_EQ(scan(directory / "top", {.entries = 20}).end, ScanResult::End::AtLimit);
    const ScanResult shallow = scan(directory / "top", {.depth = 10});
    EXPECT_EQ(shallow.tooDeep, 1U);
    EXPECT_EQ(shallow.entries, 10U);
    const ScanResult stopped = scanDirectory(
        directory / "top", {}, [](const ScanProgress& progress) { return progress.entries < 5; });
    EXPECT_EQ(stopped.end, ScanResult::End::Stopped);
    EXPECT_EQ(stopped.entries, 5U);
}

// Root reads everything, so the scan is another user's.
TEST(DirectoryScan, SaysWhatItCouldNotRead)
{
    const TestDirectory directory;
    orvane::test::write(directory / "top/open/file", "x");
    orvane::test::write(directory / "top/closed/inner/file", "x");
    fs::permissions(directory / "top/closed", fs::perms::none);
    fs::permissions(directory.path(), fs::perms::all);
    const int status = orvane::test::statusOfChild([&] {
        if (::geteuid() == 0 && ::setuid(65534) != 0)
            return 2;
        const ScanResult result = scan(directory / "top");
        return result.unreadable == 1 && result.firstUnreadable == "closed" &&
                       result.firstError == EACCES && result.entries == 3
                   ? 0
                   : 1;
    });
    fs::permissions(directory / "top/closed", fs::perms::owner_all);
    EXPECT_EQ(status, 0);
    const ScanResult nothing = scan(directory / "not-there");
    EXPECT_EQ(nothing.unreadable, 1U);
    EXPECT_EQ(nothing.firstError, ENOENT);
}

/// The module in a fake host; a worker runs when the test says so.
class DiskUsageTest : public testing::Test {
protected:
    using FakeDisk = fixwell::testing::FakeDisk;

    DiskUsageTest()
    {
        module_ = std::make_unique<DiskUsage>(host_, host_);
        EXPECT_TRUE(module_->init());
    }
    std::shared_ptr<FakeDisk> mountedDisk(const std::string& name)
    {
        fs::create_directories(directory_ / name);
        auto disk = std::make_shared<FakeDisk>(name);
        disk->mount = (directory_ / name).native();
        return disk;
    }
    void select(std::vector<contract::OVDiskPointer> disks)
    {
        host_.selection = std::move(disks);
        tellOfSelection();
    }
    void tellOfSelection()
    {
        module_->windowChangedNotication({contract::OVDiskChangedNotification, nullptr, {}});
    }
    void press() { module_->perform(button().action, nullptr); }
    void runWorkers()
    {
        for (const auto& worker : std::exchange(host_.workers, {}))
            worker();
    }
    fixwell::testing::FakeButton& button() { return host_.buttons.find("measureButton")->second; }
    bool says(std::string_view text) const
    {
        return host_.messageText.text.find(text) != std::string::npos;
    }

    TestDirectory directory_;
    fixwell::testing::FakeHost host_;
    std::unique_ptr<DiskUsage> module_;
};

TEST_F(DiskUsageTest, TheButtonSaysWhyItCannotBePressed)
{
    EXPECT_EQ(button().reason, "Select a disk first.");
    const auto image = std::make_shared<FakeDisk>("a.img");
    image->offlineImage = true;
    select({image, std::make_shared<FakeDisk>("sdx1")});
    EXPECT_EQ(button().reason, "Not available because nothing that is selected is mounted.");
    EXPECT_TRUE(says("not attached")) << host_.messageText.text;
    EXPECT_TRUE(says("“sdx1” (ext4): not mounted"));
    host_.isLocked = true;
    select({mountedDisk("data")});
    EXPECT_EQ(button().reason, "Not available while a job runs.");
    press();
    EXPECT_TRUE(host_.workers.empty()) << "the window belongs to another job";
    host_.isLocked = false;
    tellOfSelection();
    EXPECT_TRUE(button().enabled);
}

TEST_F(DiskUsageTest, AWholeDiskStandsForItsVolumes)
{
    const auto whole = std::make_shared<FakeDisk>("sdx");
    whole->whole = true;
    const auto data = mountedDisk("data");
    whole->volumes = {data, mountedDisk("other")};
    select({whole, data});
    EXPECT_TRUE(says("“other” (ext4), mounted at "));
    EXPECT_EQ(host_.messageText.text.find("“data”"), host_.messageText.text.rfind("“data”"));
    EXPECT_FALSE(says("“sdx”"));
}

TEST_F(DiskUsageTest, MeasuresUnderTheWindowsLockAndShowsWhatItFound)
{
    const auto disk = mountedDisk("data");
    const std::string hostile = "a\x1b[31m\n%@%s\xff";
    orvane::test::write(directory_ / "data" / hostile, std::string(100 * kibibyte, 'x'));
    select({disk, mountedDisk("empty")});
    EXPECT_TRUE(says(" used (")) << host_.messageText.text;
    press();
    EXPECT_TRUE(host_.isLocked);
    EXPECT_EQ(button().title, "Stop Measuring");
    press();
    EXPECT_FALSE(button().enabled) << "it is asked to stop once";
    runWorkers();
    host_.runTasks();
    EXPECT_FALSE(host_.isLocked);
    EXPECT_FALSE(says("100 KiB")) << "stopped before it began";

    press();
    runWorkers();
    host_.runTasks();
    EXPECT_TRUE(says("100 KiB  a\uFFFD[31m\uFFFD%@%s\uFFFD\n")) << host_.messageText.text;
    EXPECT_EQ(button().title, "Measure");
    EXPECT_EQ(host_.count("lock"), host_.count("unlock"));
    disk->mount = (directory_ / "empty").native();
    tellOfSelection();
    EXPECT_FALSE(says("100 KiB")) << "that was what was mounted elsewhere";
}

TEST_F(DiskUsageTest, AModuleThatGoesIsNotCalledByItsWorker)
{
    select({mountedDisk("data")});
    press();
    runWorkers();
    module_.reset();
    const auto before = host_.messageText.text;
    host_.runTasks();
    EXPECT_EQ(host_.messageText.text, before);
}

}  // namespace
}  // namespace diskusage
