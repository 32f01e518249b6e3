// SPDX-License-Identifier: Apache-2.0
#include "tests/support/TestDirectory.h"
#include "tests/terminal/ProgramTest.h"

namespace orvane::test {
namespace {

// What a user of a small machine can spare.
#if defined(__SANITIZE_ADDRESS__)
constexpr long mostMemoryInKiB = 1200 * 1024;
#else
constexpr long mostMemoryInKiB = 600 * 1024;
#endif

using VerdictTest = ProgramTest;

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
        EXPECT_EQ(runTool({"e2fsck", "-fn", path("volume")}).status, 0) << start;
    }
}

TEST_F(VerdictTest, OutputWithoutEndIsEndedInLittleMemory)
{
    makeVolume("image");
    for (const auto& [script, status] : {std::pair{"flood-bytes", 8}, {"flood-lines", 4}}) {
        useTool(script);
        const RunResult result = run({"verify", "image"});
        EXPECT_EQ(result.status, status) << result.output.substr(0, 2000) << result.errors;
        EXPECT_EQ(countOf("e2fsck printed more than a check can need", result.output), 1U);
        EXPECT_LT(linesOf(result.output).size(), 100U) << "the brief log stays readable";
        EXPECT_LT(result.mostMemoryInKiB, mostMemoryInKiB);
    }
}

}  // namespace
}  // namespace orvane::test
