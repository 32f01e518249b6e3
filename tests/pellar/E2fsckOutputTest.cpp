// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/ext/E2fsckOutput.h"

#include "tests/pellar/Recorded.h"

#include <gtest/gtest.h>

#include <algorithm>

namespace {

using namespace pellar;

test::ReadOutput readAll(const std::vector<std::string>& lines)
{
    return test::readAll(e2fsck(), lines);
}

TEST(E2fsckOutput, FindsTheProblemsInRecordedOutput)
{
    EXPECT_EQ(readAll(test::recordedLines("e2fsck/damaged")).problems(),
              (std::vector<std::string>{
                  "Entry 'f3' in / (2) has deleted/unused inode 14.  Clear? no",
                  "Entry 'f3' in / (2) has an incorrect filetype (was 1, should be 0).",
                  "Inode 16 ref count is 9, should be 1.  Fix? no", "Unattached inode 20",
                  "Block bitmap differences:  -1620", "Inode bitmap differences:  -14"}))
        << "with the question in the line and without";
}

TEST(E2fsckOutput, PassesEveryLineOnOnceAndInOrder)
{
    for (const std::string& name : test::recordingsOfE2fsck()) {
        std::vector<std::string> expected = test::recordedLines(name);
        std::erase_if(expected, [](const std::string& line) { return line.empty(); });
        std::vector<std::string> passedOn;
        for (const ToolLine& line : readAll(test::recordedLines(name)).lines)
            passedOn.push_back(line.text);
        EXPECT_EQ(passedOn, expected) << name;
    }
}

TEST(E2fsckOutput, IsNotTakenInByNamesOnTheDisk)
{
    for (const char* const line : {"File /a: 11/2048 files (9.1% non-contiguous), 1618/8192 blocks "
                                   "(inode #12, mod time Sat)",
                                   "\t/x: recovering journal (inode #13)",
                                   "Entry 'Warning: skipping journal recovery' in / (2) is fine"})
        EXPECT_EQ(readAll({line}).findings, Findings()) << line;
}

TEST(E2fsckPercent, WeighsThePasses)
{
    using Percent = std::optional<double>;
    for (const auto& [line, percent] : {std::pair("1 0 10 /dev/sdb1", Percent(0.0)),
                                        {"1 5 10 /dev/sdb1", 35.0},
                                        {"2 1 2 a label", 80.0},
                                        {"5 9 2 x", 100.0},
                                        {"3 1 2", 91.0},
                                        {"1 0 0 x", {}},
                                        {"6 1 2 x", {}},
                                        {"1 -1 2 x", {}},
                                        {"1 2", {}},
                                        {"99999999999999999999 1 2", {}},
                                        {"pass 1", {}}})
        EXPECT_EQ(e2fsckPercent(line), percent) << line;
}

}  // namespace
