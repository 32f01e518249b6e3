// SPDX-License-Identifier: Apache-2.0
#include "tests/support/ToolRun.h"
#include "tests/terminal/ProgramTest.h"

namespace orvane::test {
namespace {

class VerdictTest : public ProgramTest {
protected:
    /// A verification writes nothing; and only what is sound is called so.
    void expect(const std::string& image, const std::string& command, int status,
                std::string_view says) const
    {
        const std::string before = contentsOf(path(image));
        const RunResult result = run({command, image});
        const std::string all = image + ", " + command + "\n" + result.output;
        EXPECT_EQ(result.status, status) << all << result.errors;
        EXPECT_NE(result.output.find(says), std::string::npos) << all;
        EXPECT_EQ(result.output.find("appears to be OK.") != std::string::npos, status == 0) << all;
        EXPECT_TRUE(command == "repair" || contentsOf(path(image)) == before) << all;
    }
};

TEST_F(VerdictTest, ExitStatusAndWordsTellWhatIsTrue)
{
    makeVolume("sound");
    change(makeVolume("rootless"), "clri <2>");
    change(makeVolume("counts"), "ssv free_blocks_count 1");
    change(makeVolume("journal"), "feature needs_recovery");
    expect("sound", "repair", 0, "appears to be OK.");
    expect("rootless", "verify", 4, "Root inode is not a directory");
    expect("rootless", "repair", 1, "was repaired successfully.");
    expect("rootless", "verify", 0, "appears to be OK.");
    expect("counts", "verify", 4, "needs to be repaired.");  // where e2fsck exits with 0
    expect("journal", "verify", 8, "journal has not been replayed");
    expect("journal", "repair", 1, "was repaired successfully.");
}

TEST_F(VerdictTest, EachVolumeOfAPartitionedImageIsTreatedAndNothingBesides)
{
    const auto second = makeVolume("second", 20 * mebibyte);
    change(second, "clri <2>");
    const auto disk = makeDisk("disk.img", {makeVolume("first", 20 * mebibyte), second});
    const std::string untilThere = contentsOf(disk).substr(0, mebibyte);
    const RunResult repaired = run({"repair", "--json", "disk.img"});
    EXPECT_EQ(repaired.status, 1) << repaired.output << repaired.errors;
    const std::vector<std::string> story{"started disk.img#1", "finished disk.img#1 sound",
                                         "started disk.img#2", "finished disk.img#2 repaired"};
    EXPECT_EQ(Events(repaired.output).story({"started", "finished"}), story);
    EXPECT_TRUE(contentsOf(disk).substr(0, mebibyte) == untilThere) << "the partition map";
    for (const std::uint64_t start : {1, 21}) {
        write(path("volume"), contentsOf(disk).substr(start * mebibyte, 20 * mebibyte));
        EXPECT_EQ(runTool({"e2fsck", "-fn", path("volume")}), 0) << start;
    }
}

}  // namespace
}  // namespace orvane::test
