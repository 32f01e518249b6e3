// SPDX-License-Identifier: Apache-2.0
#include "tests/support/ToolRun.h"
#include "tests/terminal/ProgramTest.h"

namespace orvane::test {
namespace {

class VerdictTest : public ProgramTest {
protected:
    struct Answer {
        std::string_view command;
        int status;
        std::string_view says;
    };

    /// A verification writes nothing; and only what is sound is called so.
    void expect(const std::string& image, const Answer& answer) const
    {
        const std::string before = contentsOf(path(image));
        const RunResult result = run({std::string(answer.command), image});
        const std::string all = image + ", " + std::string(answer.command) + "\n" + result.output;
        EXPECT_EQ(result.status, answer.status) << all << result.errors;
        EXPECT_NE(result.output.find(answer.says), std::string::npos) << all;
        EXPECT_EQ(result.output.find("appears to be OK.") != std::string::npos, answer.status == 0)
            << all;
        EXPECT_TRUE(answer.command == "repair" || contentsOf(path(image)) == before) << all;
    }
};

TEST_F(VerdictTest, ExitStatusAndWordsTellWhatIsTrue)
{
    makeVolume("sound");
    change(makeVolume("rootless"), "clri <2>");
    change(makeVolume("counts"), "ssv free_blocks_count 1");
    change(makeVolume("journal"), "feature needs_recovery");
    struct Case {
        std::string image;
        Answer answer;
    };
    for (const Case& c : {
             Case{"sound", {"repair", 0, "appears to be OK."}},
             Case{"rootless", {"verify", 4, "Root inode is not a directory"}},
             Case{"rootless", {"verify", 4, "needs to be repaired."}},
             Case{"rootless", {"repair", 1, "was repaired successfully."}},
             Case{"rootless", {"verify", 0, "appears to be OK."}},
             Case{"counts", {"verify", 4, "Free blocks count wrong"}},  // where e2fsck exits with 0
             Case{"journal", {"verify", 8, "journal has not been replayed"}},
             Case{"journal", {"repair", 1, "was repaired successfully."}},
         })
        expect(c.image, c.answer);
}

TEST_F(VerdictTest, OtherFileSystemsAreToldAsTruly)
{
    struct Case {
        std::vector<std::string> maker;  ///< is given the image's name last
        std::uint64_t offset;            ///< what is changed in the new volume
        std::string bytes;
        std::vector<Answer> answers;
    };
    const std::string zeros(512, '\0');
    for (const Case& c : {
             Case{{"mkfs.fat", "-F", "16"},
                  37,  // the mark of a volume in use
                  "\x01",
                  {{"verify", 4, "needs to be repaired."},
                   {"repair", 1, "was repaired successfully."},
                   {"verify", 0, "appears to be OK."}}},
             Case{
                 {"mkfs.exfat"},
                 0,
                 zeros,
                 {{"verify", 4, "needs to be repaired."}, {"repair", 4, "could not be repaired."}}},
             Case{{"mkntfs", "-q", "-Q", "-F"},
                  0,
                  zeros,
                  {{"repair", 8, "cannot repair"}, {"verify", 8, "cannot verify"}}},
             Case{{"mkfs.btrfs", "-q"},
                  64U << 10U,
                  zeros,
                  {{"verify", 4, "is damaged."}, {"repair", 8, "cannot repair"}}},
         }) {
        write(path("image"), {});
        std::filesystem::resize_file(path("image"), 120 * mebibyte);
        std::vector<std::string> command = c.maker;
        command.push_back(path("image"));
        if (runTool(command) != 0)
            GTEST_SKIP() << command.front() << " is not installed";
        patch(path("image"), c.offset, c.bytes);
        for (const Answer& answer : c.answers)
            expect("image", answer);
    }
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
