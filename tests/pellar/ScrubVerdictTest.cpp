// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/btrfs/BtrfsScrub.h"
#include "tests/pellar/Recorded.h"

#include <gtest/gtest.h>

namespace {

using namespace pellar;

ScrubReport readAll(const std::vector<std::string>& lines)
{
    ScrubReport report;
    for (const std::string& line : lines)
        readScrubLine(line, report);
    return report;
}

Judgement judge(const std::vector<std::string>& lines, Ending ending,
                StopCause cause = StopCause::None, std::size_t disks = 1)
{
    return judgeScrub({ending, cause}, readAll(lines), disks);
}

TEST(ScrubVerdict, OfWhatBtrfsScrubReallyPrinted)
{
    struct Case {
        const char* recording;
        Ending ending;
        Verdict verdict;
        const char* says;
        std::string_view because;
    };
    for (const Case& c : {
             Case{"sound", Exited{0}, Verdict::Sound, "", "nothing found"},
             Case{"two-disks", Exited{0}, Verdict::Sound, "", "both were read"},
             Case{"file", Exited{3}, Verdict::Damaged, "without any good copy", "one block"},
             Case{"one-copy", Exited{0}, Verdict::Damaged, "another, good copy",
                  "0 and \"corrected\", but nothing was corrected"},
             Case{"no-copy", Exited{3}, Verdict::Damaged, "without any good copy", "both copies"},
             Case{"file-and-copy", Exited{3}, Verdict::Damaged, "without any good copy",
                  "the worse of the two is told"},
             Case{"superblock", Exited{0}, Verdict::Damaged, "", "0, and no warning at all"},
             Case{"missing-disk", Exited{0}, Verdict::Inconclusive, "another disk", "0"},
             Case{"debian13-sound", Exited{0}, Verdict::Sound, "", "it says that it starts"},
             Case{"debian13-two-disks", Exited{0}, Verdict::Sound, "", "for each disk"},
             Case{"debian13-file", Exited{3}, Verdict::Damaged, "without any good copy",
                  "it counts the errors in its sentence"},
             Case{"debian13-one-copy", Exited{0}, Verdict::Damaged, "another, good copy",
                  "\"1 corrected\", but nothing was corrected"},
             Case{"debian13-missing-disk", Exited{0}, Verdict::Inconclusive, "another disk",
                  "it says that it starts on the missing one"},
             Case{"other", Exited{1}, Verdict::Failed, "another program is", "says so"},
             Case{"other-unrecorded", Exited{1}, Verdict::Failed, "another program is",
                  "only the kernel knows of the other"},
             Case{"stopped", Exited{1}, Verdict::Failed, "another program has ended",
                  "it was not us"},
             Case{"no-right", Exited{1}, Verdict::Failed, "could not do its work", "not root"},
             Case{"sound", Killed{9}, Verdict::Failed, "was killed", "whatever it had said"},
             Case{"sound", Exited{3}, Verdict::Damaged, "", "the status says more than the text"},
         }) {
        const Judgement judgement =
            judge(test::recordedLines("btrfs-scrub/" + std::string(c.recording)), c.ending,
                  StopCause::None, std::string_view(c.recording).ends_with("two-disks") ? 2 : 1);
        EXPECT_EQ(judgement.verdict, c.verdict) << c.recording << ": " << c.because;
        EXPECT_NE(judgement.reason.key.find(c.says), std::string_view::npos)
            << c.recording << ": " << judgement.reason.key;
    }
    EXPECT_EQ(judge(test::recordedLines("btrfs-scrub/stopped"), Exited{1}, StopCause::User).verdict,
              Verdict::Stopped);
}

TEST(ScrubVerdict, OutputThatIsCutShortIsNeverSound)
{
    for (const std::size_t disks : {1U, 2U}) {
        auto lines =
            test::recordedLines(disks == 1 ? "btrfs-scrub/sound" : "btrfs-scrub/two-disks");
        while (!lines.empty()) {
            lines.pop_back();
            EXPECT_NE(judge(lines, Exited{0}, StopCause::None, disks).verdict, Verdict::Sound)
                << disks << " disks, " << lines.size() << " lines";
        }
    }
}

}  // namespace
