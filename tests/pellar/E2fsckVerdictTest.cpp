// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/ToolTable.h"
#include "tests/pellar/Recorded.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <csignal>

namespace {

using namespace pellar;
using test::readAll;
using test::recordedLines;

Judgement judge(const RunEvidence& evidence)
{
    return e2fsck().judge(evidence);
}

VolumeFacts plainVolume()
{
    VolumeFacts volume;
    volume.isRecognized = volume.hasPrimary = true;
    volume.volumeBytes = volume.availableBytes = 8U << 20U;
    return volume;
}

RunEvidence evidence(Ending ending, Findings findings, Access access = Access::ReadOnly)
{
    return {access, {ending, StopCause::None}, findings, plainVolume()};
}

TEST(E2fsckVerdict, OfRecordedVerifications)
{
    struct Case {
        std::string_view recording;
        int status;
        Verdict verdict;
        std::string_view because;
    };
    for (const Case& c :
         {Case{"sound", 0, Verdict::Sound, "nothing found"},
          Case{"optimizable", 0, Verdict::Sound, "a saving is no damage"},
          Case{"wrong-free-count", 0, Verdict::Damaged, "a repair would write this, despite 0"},
          Case{"damaged", 4, Verdict::Damaged, "it says so itself"},
          Case{"multiply-claimed", 4, Verdict::Damaged, "it says so itself"},
          Case{"old-journal", 0, Verdict::Damaged, "a repair would write this, and asks nothing"},
          Case{"backup-superblock", 4, Verdict::Damaged, "the main superblock is lost"},
          Case{"gave-up", 12, Verdict::Damaged, "gave up with damage in sight"},
          Case{"journal-skipped", 0, Verdict::Inconclusive,
               "the wrong count may be put right by the journal"},
          Case{"external-journal-missing", 12, Verdict::Inconclusive, "half of it is not here"},
          Case{"no-superblock", 8, Verdict::Damaged, "no superblock where there was one"},
          Case{"crashed", 8, Verdict::Failed, "a crash is no answer"},
          Case{"cancelled", 32, Verdict::Stopped, "somebody interrupted it"}})
        EXPECT_EQ(
            judge(evidence(Exited{c.status}, readAll(recordedLines(c.recording)).findings)).verdict,
            c.verdict)
            << c.recording << ": " << c.because;
}

TEST(E2fsckVerdict, TruncatedOutputNeverReadsAsSound)
{
    for (const std::string& name : test::recordings()) {
        const std::vector<std::string> all = recordedLines(name);
        for (std::size_t kept = 0; kept < all.size(); ++kept) {
            const std::vector<std::string> lines(all.begin(),
                                                 all.begin() + static_cast<std::ptrdiff_t>(kept));
            EXPECT_NE(judge(evidence(Exited{0}, readAll(lines).findings)).verdict, Verdict::Sound)
                << name << " after " << kept << " lines";
        }
    }
}

TEST(E2fsckVerdict, OnlyACleanExitIsSound)
{
    const Findings complete = readAll(recordedLines("sound")).findings;
    for (int status = 1; status < 256; ++status)
        EXPECT_NE(judge(evidence(Exited{status}, complete)).verdict, Verdict::Sound) << status;
    for (const Ending& ending : {Ending(Killed{SIGKILL}), Ending(Killed{SIGINT}),
                                 Ending(NotStarted{ENOENT}), Ending(NotStarted{EMFILE})})
        EXPECT_EQ(judge(evidence(ending, complete)).verdict, Verdict::Failed);
}

TEST(E2fsckVerdict, WeighsWhatWeKnowBesides)
{
    const Findings sound = readAll(recordedLines("sound")).findings;
    const Findings damaged = readAll(recordedLines("damaged")).findings;
    RunEvidence run = evidence(Exited{0}, sound);
    run.volume.availableBytes = run.volume.volumeBytes - 1;
    EXPECT_EQ(judge(run).verdict, Verdict::Damaged) << "its last byte is missing";

    run = evidence(Exited{0}, sound);
    run.volume.needsRecovery = true;
    EXPECT_EQ(judge(run).verdict, Verdict::Inconclusive) << "also when the tool says nothing";

    run = evidence(Exited{0}, sound);
    run.result.cause = StopCause::User;
    EXPECT_EQ(judge(run).verdict, Verdict::Stopped) << "it was stopped, however it ended";

    run = evidence(Killed{SIGINT}, damaged);
    run.result.cause = StopCause::TooMuchOutput;
    EXPECT_EQ(judge(run).verdict, Verdict::Damaged) << "what it had found stands";
    run.findings = {};
    EXPECT_EQ(judge(run).code, contract::kPLErrorToolMisbehaved);

    Findings inUse;
    inUse.foundDiskInUse = true;
    EXPECT_EQ(judge(evidence(Exited{8}, inUse)).code, contract::kPLErrorDiskInUse);
}

TEST(E2fsckVerdict, OfRepairingRuns)
{
    struct Case {
        std::string_view recording;
        int status;
        bool madeProgress;
        std::string_view because;
    };
    for (const Case& c : {Case{"repaired", 1, true, "all corrected"},
                          Case{"repaired", 3, true, "and the root volume is to be rebooted"},
                          Case{"sound", 0, false, "there was nothing to do"},
                          Case{"no-superblock", 8, false, "it got nowhere"}})
        EXPECT_EQ(judge(evidence(Exited{c.status}, readAll(recordedLines(c.recording)).findings,
                                 Access::ReadWrite))
                      .madeProgress,
                  c.madeProgress)
            << c.because;
}

TEST(E2fsckArguments, OnlyARepairMayWrite)
{
    // Every option of e2fsck(8) that lets it write.
    const std::vector<std::string> writing{"-y", "-p", "-a", "-D", "-c", "-l", "-L", "-z"};
    for (const std::uint64_t offset : {0U, 4096U}) {
        const auto verify = e2fsck().arguments(Access::ReadOnly, "/proc/self/fd/3", offset);
        for (const std::string& option : writing)
            EXPECT_EQ(std::count(verify.begin(), verify.end(), option), 0) << option;
        EXPECT_EQ(std::count(verify.begin(), verify.end(), "-n"), 1);
        const auto repair = e2fsck().arguments(Access::ReadWrite, "/proc/self/fd/3", offset);
        EXPECT_EQ(std::count(repair.begin(), repair.end(), "-n"), 0);
    }
}

}  // namespace
