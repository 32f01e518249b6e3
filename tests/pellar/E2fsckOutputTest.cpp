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

test::ReadOutput readRecording(std::string_view name)
{
    return readAll(test::recordedLines("e2fsck/" + std::string(name)));
}

TEST(E2fsckOutput, FindsTheProblemsInRecordedOutput)
{
    struct Case {
        std::string_view recording;
        std::vector<std::string> problems;
        std::string_view because;
    };
    for (const Case& c :
         {Case{"sound", {}, "nothing is wrong"},
          Case{"optimizable", {}, "a tree that could be shorter is no damage"},
          Case{"wrong-free-count",
               {"Free blocks count wrong (1, counted=6574)."},
               "the question stands in the next line"},
          Case{"multiply-claimed",
               {"File /r1 (inode #12, mod time Sat Nov 21 12:08:37 2026) ",
                "File /r2 (inode #13, mod time Sat Nov 21 12:08:37 2026) ",
                "Block bitmap differences:  -565"},
               "a paragraph, and two questions about one problem"},
          Case{"damaged",
               {"Entry 'f3' in / (2) has deleted/unused inode 14.  Clear? no",
                "Entry 'f3' in / (2) has an incorrect filetype (was 1, should be 0).",
                "Inode 16 ref count is 9, should be 1.  Fix? no", "Unattached inode 20",
                "Block bitmap differences:  -1620", "Inode bitmap differences:  -14"},
               "with the question in the line and without"},
          Case{"external-journal-missing", {"Can't find external journal"}, "the check's own"},
          Case{"crashed",
               {"Signal (11) SIGSEGV (sent from pid 6706) si_code=SI_USER "},
               "e2fsck tells of its crash"}})
        EXPECT_EQ(readRecording(c.recording).problems(), c.problems)
            << c.recording << ": " << c.because;
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

TEST(E2fsckOutput, SumsUpWhatWasSaid)
{
    EXPECT_TRUE(readRecording("journal-skipped").findings.skippedJournal);
    EXPECT_TRUE(readRecording("journal-replayed").findings.replayedJournal);
    EXPECT_TRUE(readRecording("external-journal-missing").findings.lacksExternalJournal);
    EXPECT_TRUE(readRecording("gave-up").findings.hasErrorsLeft);
    EXPECT_FALSE(readRecording("gave-up").findings.isComplete);
    EXPECT_EQ(readRecording("crashed").findings.crashSignal, 11);
    const Findings repaired = readRecording("repaired").findings;
    EXPECT_TRUE(repaired.wasModified);
    EXPECT_EQ(repaired.corrections, repaired.problems);
    EXPECT_EQ(repaired.corrections, 10U);
}

TEST(E2fsckOutput, IsNotTakenInByNamesOnTheDisk)
{
    struct Case {
        std::string_view line;
        std::string_view because;
    };
    for (const Case& c :
         {Case{"File /a: 11/2048 files (9.1% non-contiguous), 1618/8192 blocks (inode #12, mod "
               "time Sat)",
               "a file named like the last line"},
          Case{"\t/x: recovering journal (inode #13)", "a file named like a replay"},
          Case{"Entry 'Warning: skipping journal recovery' in / (2) is fine", "a file's name"}}) {
        const Findings findings = readAll({std::string(c.line)}).findings;
        EXPECT_EQ(findings, Findings()) << c.because;
    }
}

TEST(E2fsckPercent, WeighsThePasses)
{
    struct Case {
        std::string_view line;
        std::optional<double> percent;
    };
    for (const Case& c :
         {Case{"1 0 10 /dev/sdb1", 0.0}, Case{"1 5 10 /dev/sdb1", 35.0},
          Case{"2 1 2 a label", 80.0}, Case{"5 2 2 x", 100.0}, Case{"5 9 2 x", 100.0},
          Case{"3 1 2", 91.0}, Case{"1 0 0 x", {}}, Case{"6 1 2 x", {}}, Case{"0 1 2 x", {}},
          Case{"1 -1 2 x", {}}, Case{"1 2", {}}, Case{"99999999999999999999 1 2", {}}, Case{"", {}},
          Case{"pass 1", {}}})
        EXPECT_EQ(e2fsckPercent(c.line), c.percent) << c.line;
}

}  // namespace
