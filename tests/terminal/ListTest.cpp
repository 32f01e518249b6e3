// SPDX-License-Identifier: Apache-2.0
#include "tests/support/ToolRun.h"
#include "tests/terminal/ProgramTest.h"

namespace orvane::test {
namespace {

class ListTest : public ProgramTest {};

TEST_F(ListTest, TellsWhatIsKnownOfAnImage)
{
    makeVolume("image", 8 * mebibyte, {"-L", "Holidays"});
    static_cast<void>(run({"verify", "image"}));
    const RunResult result = run({"list", "--json", "image"});
    EXPECT_EQ(result.status, 0);
    const auto disks = Events(result.output).named("disk");
    ASSERT_EQ(disks.size(), 1U) << result.output;
    const nlohmann::json& disk = disks.front();
    EXPECT_EQ(disk["disk"], "image");
    EXPECT_EQ(disk["name"], "Holidays");
    EXPECT_EQ(disk["bytes"], 8 * mebibyte);
    EXPECT_EQ(disk["filesystem"], "ext4");
    EXPECT_TRUE(disk["mountPoint"].is_null());
    EXPECT_EQ(disk["verdict"], "sound");
    EXPECT_EQ(disk["actions"]["verify"]["available"], true);
    EXPECT_TRUE(disk["actions"]["verify"]["reason"].is_null());
    EXPECT_EQ(disk["actions"]["verify-permissions"]["available"], false);
    EXPECT_TRUE(disk["actions"]["verify-permissions"]["reason"].is_string());
}

// What the list shows is what commands take.
TEST_F(ListTest, AMountedDiskIsFoundByItsMountPoint)
{
    const Events listed(run({"list", "--json"}).output);
    int mounted = 0;
    for (const auto& disk : listed.named("disk")) {
        if (disk["mountPoint"].is_null())
            continue;
        ++mounted;
        const auto place = disk["mountPoint"].get<std::string>();
        const RunResult result = run({"list", "--json", place});
        // Other programs mount and unmount, too; another test, for one.
        if (contentsOf("/proc/self/mounts").find(' ' + place + ' ') == std::string::npos)
            continue;
        EXPECT_EQ(result.status, 0) << result.errors << result.output;
        const auto found = Events(result.output).named("disk");
        ASSERT_GE(found.size(), 1U) << disk << result.output;
        EXPECT_EQ(found.front()["bytes"], disk["bytes"]) << result.output;
        EXPECT_EQ(found.front()["filesystem"], disk["filesystem"]) << result.output;
    }
    if (mounted == 0)
        GTEST_SKIP() << "no disk of this machine is seen to be mounted";
}

TEST_F(ListTest, APartitionedImageShowsItsVolumesBelow)
{
    write(path("disk.img"), {});
    std::filesystem::resize_file(path("disk.img"), 64 * mebibyte);
    ASSERT_EQ(runTool({"sfdisk", "-q", path("disk.img")},
                      "label: gpt\nstart=2048, size=40960\nstart=43008, size=40960\n"),
              0);
    patch(path("disk.img"), 21 * mebibyte,
          contentsOf(makeVolume("second", 20 * mebibyte, {"-L", "Second"})));
    const auto disks = Events(run({"list", "--json", "disk.img"}).output).named("disk");
    ASSERT_EQ(disks.size(), 3U);
    EXPECT_EQ(disks[0]["disk"], "disk.img");
    EXPECT_EQ(disks[1]["disk"], "disk.img#1");
    EXPECT_TRUE(disks[1]["filesystem"].is_null());
    EXPECT_EQ(disks[2]["disk"], "disk.img#2");
    EXPECT_EQ(disks[2]["name"], "Second");
}

}  // namespace
}  // namespace orvane::test
