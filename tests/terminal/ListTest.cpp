// SPDX-License-Identifier: Apache-2.0
// What is known of disks, and what root does with them where there is no UDisks2.

#include "tests/support/LoopDevice.h"
#include "tests/support/TestDirectory.h"
#include "tests/terminal/ProgramTest.h"

#include <fstream>

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
        "verdict":"sound","laterAttempt":null,"nextCheck":null,"interruptedRepair":null,
        "actions":{"verify":{"available":true,"reason":null},"verify-permissions":{"available":false,
        "reason":"Not available because the selected disk is not mounted."}}})"));
}

TEST_F(ListTest, PeopleReadTheFormatsNameAndProgramsItsType)
{
    std::ofstream(path("fat")).close();
    std::filesystem::resize_file(path("fat"), 64 * mebibyte);
    prepareWith({"mkfs.fat", "-F", "16", path("fat").native()});
    const std::string text = run({"list", "fat"}).output;
    EXPECT_NE(text.find("disk image  FAT16"), std::string::npos) << text;
    EXPECT_EQ(Events(run({"list", "--json", "fat"}).output).named("disk").front()["filesystem"],
              "vfat");
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

TEST_F(HistoryCommandTest, AReportTellsTheDiskAndItsRunsAndFailsWhereItCannotBeWritten)
{
    makeDamagedVolume("a");
    for (const char* const command : {"verify", "repair"})
        static_cast<void>(run({command, "a"}));
    const std::string all = run({"report", "a"}).output;
    EXPECT_LT(all.find("· damaged"), all.find("needs to be repaired")) << all;
    EXPECT_LT(all.find("needs to be repaired"), all.find("· repaired")) << all;
    EXPECT_EQ(all.find("never checked"), std::string::npos);
    EXPECT_EQ(all.find("Checking inodes"), std::string::npos);
    const std::string last = run({"report", "--last", "--html", "--details", "a"}).output;
    EXPECT_EQ(last.find("damaged</h3>"), std::string::npos) << last;
    EXPECT_NE(last.find("repaired</h3>"), std::string::npos) << last;
    EXPECT_NE(last.find("<li>Checking inodes"), std::string::npos) << last;
    EXPECT_TRUE(last.ends_with("</html>\n"));
    EXPECT_EQ(run({"report", "--json", "a"}).status, 16);
    EXPECT_EQ(run({"report", "nowhere"}).status, 8);

    for (int times = 0; times < 16; ++times)
        static_cast<void>(run({"verify", "a"}));
    EXPECT_NE(run({"report", "a"}).output.find("needs to be repaired"), std::string::npos)
        << "a check reads the newest records alone, a report all";
}

class DiskActionTest : public ProgramTest {
protected:
    void SetUp() override
    {
        ProgramTest::SetUp();
        if (const char* const obstacle = LoopDevice::obstacle())
            GTEST_SKIP() << obstacle;
        environment_["DBUS_SYSTEM_BUS_ADDRESS"] = "unix:path=/nonexistent/bus";
    }
    void TearDown() override
    {
        if (!device_.empty())
            runTool({"losetup", "-d", device_});
        ProgramTest::TearDown();
    }

    std::string device_;  ///< attached by the program, and not detached yet
};

TEST_F(DiskActionTest, AnImageIsAttachedMountedAndDetached)
{
    const auto image = makeVolume("\x1b[31mvolume.img");
    const RunResult refused = run({"eject", image});
    EXPECT_EQ(refused.status, 8);
    EXPECT_NE(refused.errors.find("cannot eject"), std::string::npos) << refused.errors;
    const RunResult attached = run({"attach", image});
    ASSERT_EQ(attached.status, 0) << attached.errors;
    ASSERT_TRUE(attached.output.starts_with("/dev/loop") && attached.output.ends_with('\n'));
    device_ = attached.output.substr(0, attached.output.size() - 1);

    const RunResult again = run({"attach", image});
    EXPECT_NE(again.errors.find("it is attached already, as " + device_), std::string::npos);
    EXPECT_FALSE(holdsControls(again.errors));
    EXPECT_EQ(run({"verify", image}).status, 8) << "two would work on one volume";

    EXPECT_EQ(run({"mount", device_}).status, 8) << "nothing says where to";
    std::filesystem::create_directory(path("place"));
    std::ofstream(path("fstab")) << device_ << " " << path("place").native() << " ext4 ro 0 0\n";
    environment_["LIBMOUNT_FSTAB"] = path("fstab");
    const RunResult mounted = run({"mount", "--json", device_});
    EXPECT_EQ(mounted.status, 0) << mounted.errors;
    EXPECT_EQ(Events(mounted.output).named("done").at(0)["place"], path("place").native());

    const RunResult detached = run({"detach", "--json", image});
    EXPECT_EQ(detached.status, 0) << detached.errors;
    EXPECT_EQ(Events(detached.output).named("done").at(0)["disk"], image.native())
        << "as the user named it";
    device_.clear();
    EXPECT_EQ(run({"verify", image}).status, 0);
}

TEST_F(DiskActionTest, ACopyOfADiskHasItsOwnVerdict)
{
    const auto image = makeDamagedVolume("disk.img");
    std::filesystem::copy_file(image, path("copy.img"));
    const LoopDevice disk(image);
    const LoopDevice copy(path("copy.img"));
    EXPECT_EQ(run({"verify", copy.name()}).status, 4);
    for (const std::vector<std::string>& asked :
         {std::vector{disk.name(), copy.name()}, {copy.name(), disk.name()}}) {
        std::vector<std::string> arguments{"list", "--json"};
        arguments.insert(arguments.end(), asked.begin(), asked.end());
        for (const auto& one : Events(run(arguments).output).named("disk"))
            EXPECT_EQ(one["lastChecked"].is_null(), one["disk"] == disk.name()) << one;
    }
}

}  // namespace
}  // namespace orvane::test
