// SPDX-License-Identifier: Apache-2.0
#include "tests/terminal/ProgramTest.h"

namespace orvane::test {
namespace {

using ListTest = ProgramTest;

TEST_F(ListTest, TellsWhatIsKnownOfAnImage)
{
    makeVolume("image", 8 * mebibyte, {"-L", "Holidays"});
    static_cast<void>(run({"verify", "image"}));
    const auto disks = Events(run({"list", "--json", "image"}).output).named("disk");
    ASSERT_EQ(disks.size(), 1U);
    nlohmann::json disk = disks.front();
    EXPECT_TRUE(disk["lastChecked"].is_string());
    disk.erase("lastChecked");
    disk["actions"].erase("repair");
    disk["actions"].erase("repair-permissions");
    EXPECT_EQ(disk, nlohmann::json::parse(R"({"event":"disk","disk":"image","name":"Holidays",
        "kind":"disk image","bytes":8388608,"filesystem":"ext4","mountPoint":null,
        "verdict":"sound","laterAttempt":null,
        "actions":{"verify":{"available":true,"reason":null},"verify-permissions":{"available":false,
        "reason":"Not available because the selected disk is not mounted."}}})"));
}

// What the list shows is what commands take.
TEST_F(ListTest, APartitionedImageShowsItsVolumesBelow)
{
    write(path("nothing"), std::string(8 * mebibyte, '\0'));
    makeDisk("disk.img", {path("nothing"), makeVolume("second", 8 * mebibyte, {"-L", "Second"})});
    const auto disks = Events(run({"list", "--json", "disk.img"}).output).named("disk");
    ASSERT_EQ(disks.size(), 3U);
    EXPECT_EQ(disks[0]["disk"], "disk.img");
    EXPECT_EQ(disks[1]["disk"], "disk.img#1");
    EXPECT_TRUE(disks[1]["filesystem"].is_null());
    EXPECT_EQ(disks[2]["disk"], "disk.img#2");
    EXPECT_EQ(disks[2]["name"], "Second");
}

class HistoryCommandTest : public ProgramTest {
protected:
    std::vector<std::string> verdicts(const std::string& image) const
    {
        std::vector<std::string> found;
        for (const auto& one : Events(run({"history", "--json", image}).output).named("run"))
            found.push_back(one["verdict"]);
        return found;
    }
};

TEST_F(HistoryCommandTest, RunsOutliveTheProgramUntilTheyAreCleared)
{
    makeDamagedVolume("a");
    makeVolume("b");
    for (const char* const command : {"verify", "repair", "verify"})
        static_cast<void>(run({command, "a"}));
    EXPECT_EQ(verdicts("a"), (std::vector<std::string>{"damaged", "repaired", "sound"}));
    EXPECT_NE(run({"history", "b"}).output.find("never checked"), std::string::npos);

    static_cast<void>(run({"verify", "b"}));
    for (int times = 0; times < 2; ++times)
        EXPECT_EQ(run({"history", "--clear", "a"}).status, 0) << "there may be nothing to clear";
    EXPECT_TRUE(verdicts("a").empty());
    EXPECT_EQ(verdicts("b").size(), 1U) << "each image has its own";
}

}  // namespace
}  // namespace orvane::test
