// SPDX-License-Identifier: Apache-2.0
#include "tests/support/ToolRun.h"
#include "tests/terminal/ProgramTest.h"

namespace orvane::test {
namespace {

class VerdictTest : public ProgramTest {
protected:
    /// A disk of 64 MiB with two volumes: a sound one, and the other as told.
    std::filesystem::path makePartitionedDisk(std::string_view name, bool isSecondDamaged) const;
};

std::filesystem::path VerdictTest::makePartitionedDisk(std::string_view name,
                                                       bool isSecondDamaged) const
{
    write(path(name), {});
    std::filesystem::resize_file(path(name), 64 * mebibyte);
    if (runTool({"sfdisk", "-q", path(name)},
                "label: gpt\nstart=2048, size=40960\nstart=43008, size=40960\n") != 0)
        throw std::runtime_error("cannot prepare the test: sfdisk failed");
    const auto first = makeVolume("first", 20 * mebibyte, {"-L", "first"});
    const auto second = makeVolume("second", 20 * mebibyte, {"-L", "second"});
    if (isSecondDamaged)
        change(second, "clri <2>");
    patch(path(name), 1 * mebibyte, contentsOf(first));
    patch(path(name), 21 * mebibyte, contentsOf(second));
    return path(name);
}

TEST_F(VerdictTest, ExitStatusAndWordsTellWhatIsTrue)
{
    struct Case {
        std::string_view name;
        std::string_view change;
        std::string_view command;
        int status;
        std::string_view says;
        std::string_view neverSays;
        std::string_view because;
    };
    for (const Case& c : {
             Case{"sound", "", "verify", 0, "appears to be OK.", "needs to be repaired.", "sound"},
             Case{"sound", "", "repair", 0, "appears to be OK.", "was repaired", "nothing to do"},
             Case{"rootless", "clri <2>", "verify", 4, "Root inode is not a directory",
                  "appears to be OK.", "what is wrong is named"},
             Case{"rootless", "", "verify", 4, "needs to be repaired.", "appears to be OK.",
                  "and what follows from it"},
             Case{"rootless", "", "repair", 1, "was repaired successfully.",
                  "needs to be repaired.", "damage was found and repaired"},
             Case{"rootless", "", "verify", 0, "appears to be OK.", "needs to be repaired.",
                  "the repair holds"},
             Case{"counts", "ssv free_blocks_count 1", "verify", 4, "Free blocks count wrong",
                  "appears to be OK.", "e2fsck itself exits 0 here"},
             Case{"journal", "feature needs_recovery", "verify", 8, "journal has not been replayed",
                  "appears to be OK.", "only a repair replays it"},
             Case{"journal", "", "repair", 1, "was repaired successfully.", "needs to be repaired.",
                  "the journal is replayed"},
             Case{"journal", "", "verify", 0, "appears to be OK.", "replayed", "it stays so"},
         }) {
        const std::string name(c.name);
        if (!std::filesystem::exists(path(name)))
            makeVolume(name);
        if (!c.change.empty())
            change(path(name), std::string(c.change));
        const RunResult result = run({std::string(c.command), name});
        EXPECT_EQ(result.status, c.status) << c.because << "\n" << result.output << result.errors;
        EXPECT_NE(result.output.find(c.says), std::string::npos) << c.because << "\n"
                                                                 << result.output;
        EXPECT_EQ(result.output.find(c.neverSays), std::string::npos) << c.because << "\n"
                                                                      << result.output;
    }
}

TEST_F(VerdictTest, VerifyWritesNothing)
{
    for (const auto& image : {makeDamagedVolume("damaged"), makeVolume("sound")}) {
        const std::string before = contentsOf(image);
        static_cast<void>(run({"verify", image}));
        EXPECT_TRUE(contentsOf(image) == before) << image;
    }
}

TEST_F(VerdictTest, EachVolumeOfAPartitionedImageIsChecked)
{
    makePartitionedDisk("sound.img", false);
    makePartitionedDisk("damaged.img", true);
    const RunResult sound = run({"verify", "--json", "sound.img"});
    EXPECT_EQ(sound.status, 0) << sound.output << sound.errors;
    const std::vector<std::string> soundStory{"started sound.img#1", "finished sound.img#1 sound",
                                              "started sound.img#2", "finished sound.img#2 sound"};
    EXPECT_EQ(Events(sound.output).story({"started", "finished"}), soundStory);

    const RunResult damaged = run({"verify", "--json", "damaged.img"});
    EXPECT_EQ(damaged.status, 4) << damaged.output << damaged.errors;
    const std::vector<std::string> damagedStory{
        "started damaged.img#1", "finished damaged.img#1 sound", "started damaged.img#2",
        "finished damaged.img#2 damaged"};
    EXPECT_EQ(Events(damaged.output).story({"started", "finished"}), damagedStory);
}

TEST_F(VerdictTest, RepairOfAPartitionedImageLeavesTheOtherVolumeAlone)
{
    const auto disk = makePartitionedDisk("disk.img", true);
    const auto firstVolume = [&disk] {
        return contentsOf(disk).substr(mebibyte, 20 * mebibyte);
    };
    const std::string untilThere = contentsOf(disk).substr(0, mebibyte);
    EXPECT_EQ(run({"repair", "disk.img"}).status, 1);
    EXPECT_TRUE(contentsOf(disk).substr(0, mebibyte) == untilThere) << "the partition map";
    write(path("volume"), firstVolume());
    EXPECT_EQ(runTool({"e2fsck", "-fn", path("volume")}), 0);
    EXPECT_EQ(run({"verify", "disk.img"}).status, 0);
}

TEST_F(VerdictTest, StatusesOfSeveralImagesAreAddedUp)
{
    makeVolume("sound");
    makeDamagedVolume("damaged");
    change(makeVolume("journal"), "feature needs_recovery");
    const RunResult all = run({"verify", "sound", "damaged", "journal", "missing"});
    EXPECT_EQ(all.status, 4 | 8) << all.output << all.errors;
    EXPECT_EQ(run({"repair", "sound", "damaged", "journal"}).status, 1);
    EXPECT_EQ(run({"verify", "sound", "damaged", "journal"}).status, 0);
}

// A repair would throw away what lies behind the end.
TEST_F(VerdictTest, ATruncatedImageIsDamagedAndIsNeverRepaired)
{
    const auto image = makeVolume("image", 32 * mebibyte);
    std::filesystem::resize_file(image, 20 * mebibyte);
    const std::string before = contentsOf(image);
    const RunResult verified = run({"verify", "image"});
    EXPECT_EQ(verified.status, 4);
    EXPECT_NE(verified.output.find("cut short"), std::string::npos) << verified.output;
    const RunResult repaired = run({"repair", "image"});
    EXPECT_EQ(repaired.status, 4);
    EXPECT_NE(repaired.output.find("could not be repaired."), std::string::npos) << repaired.output;
    EXPECT_TRUE(contentsOf(image) == before);
}

}  // namespace
}  // namespace orvane::test
