// SPDX-License-Identifier: Apache-2.0
#include "tests/support/TestDirectory.h"
#include "tests/terminal/ProgramTest.h"

namespace orvane::test {
namespace {

using PartitionMapTest = ProgramTest;

std::string zeros(std::size_t count)
{
    return std::string(count, '\0');
}

TEST_F(PartitionMapTest, ADamagedMapOfAnImageIsNamedWhateverElseIsChecked)
{
    const auto disk = makeDisk("disk.img", {makeVolume("volume")});
    const auto names = [this](const char* command) {
        const RunResult result = run({command, "disk.img"});
        return result.errors.find(
                   "the partition map of “disk.img” is damaged; --partition-map "
                   "checks and repairs it") != std::string::npos;
    };
    EXPECT_FALSE(names("verify")) << "both copies are sound";
    patch(disk, 512, zeros(512));
    EXPECT_TRUE(names("verify")) << "its volume is checked, and the map is not";
    EXPECT_TRUE(names("list"));
    patch(disk, 10 * mebibyte - 512, zeros(512));
    EXPECT_TRUE(names("verify")) << "neither copy says where its volume is";
}

TEST_F(PartitionMapTest, OneJobTreatsSeveralDisksWhateverBecomesOfEach)
{
    const auto broken = makeDisk("broken.img", {makeVolume("volume")});
    makeDisk("sound.img", {makeVolume("volume")}, "dos");
    makeVolume("bare.img");
    patch(broken, 1024, zeros(8));
    patch(broken, 10 * mebibyte - 33 * 512, zeros(8));
    const std::string before = contentsOf(broken);
    const RunResult all =
        run({"repair", "--json", "--partition-map", "broken.img", "sound.img", "bare.img", "none"});
    EXPECT_EQ(all.status, 4 | 8) << all.output << all.errors;
    const std::vector<std::string> story{"finished none failed",
                                         "finished bare.img failed",
                                         "started broken.img",
                                         "finished broken.img damaged",
                                         "started sound.img",
                                         "finished sound.img sound",
                                         "report",
                                         "alert"};
    const Events events(all.output);
    EXPECT_EQ(events.story({"started", "finished", "report", "alert"}), story);
    const auto records = events.recordsWith("Neither copy of the partition map");
    ASSERT_FALSE(records.empty()) << all.output;
    EXPECT_EQ(records.front()["disk"], "broken.img")
        << "who reads along can show each with its disk";
    EXPECT_EQ(records.front()["verbosity"], -1);
    EXPECT_TRUE(contentsOf(broken) == before);
}

TEST_F(PartitionMapTest, SpeaksTheUsersLanguage)
{
    environment_["LANGUAGE"] = "de";
    patch(makeDisk("disk.img", {makeVolume("volume")}), 512, zeros(512));
    const RunResult repaired = run({"repair", "--details", "--partition-map", "disk.img"});
    EXPECT_NE(repaired.output.find("Die Hauptkopie der Partitionstabelle fehlt."),
              std::string::npos)
        << repaired.output;
    for (const std::string_view english : {"The ", "Writing", "Reading", " is ", "sectors"})
        EXPECT_EQ(repaired.output.find(english), std::string::npos) << repaired.output;
}

}  // namespace
}  // namespace orvane::test
