// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/btrfs/BtrfsScrub.h"
#include "tests/pellar/Recorded.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <map>
#include <random>

namespace {

using namespace pellar;

using test::readAll;
using test::recordedLines;

VolumeFacts plainVolume()
{
    VolumeFacts volume;
    volume.isRecognized = volume.hasPrimary = true;
    volume.volumeBytes = volume.availableBytes = 32U << 20U;
    return volume;
}

Judgement judge(const Tool& tool, const std::vector<std::string>& lines, Ending ending,
                VolumeFacts volume = plainVolume(), Access access = Access::ReadOnly)
{
    return tool.judge({access, {ending, StopCause::None}, readAll(tool, lines).findings, volume});
}

struct Case {
    std::string_view filesystem;
    std::string_view recording;
    int status;
    Verdict verdict;
    std::size_t problems;  ///< how many of its lines are shown as problems
    std::string_view because;
};

const std::vector<Case> verifications{
    {"ext4", "e2fsck/sound", 0, Verdict::Sound, 0, "nothing found"},
    {"ext4", "e2fsck/optimizable", 0, Verdict::Sound, 0, "a saving is no damage"},
    {"ext4", "e2fsck/wrong-free-count", 0, Verdict::Damaged, 1, "a repair would write, despite 0"},
    {"ext4", "e2fsck/damaged", 4, Verdict::Damaged, 6, "it says so itself"},
    {"ext4", "e2fsck/multiply-claimed", 4, Verdict::Damaged, 3, "it says so itself"},
    {"ext4", "e2fsck/old-journal", 0, Verdict::Damaged, 1, "a repair would write, and not ask"},
    {"ext4", "e2fsck/backup-superblock", 4, Verdict::Damaged, 20, "the main superblock is lost"},
    {"ext4", "e2fsck/gave-up", 12, Verdict::Damaged, 12, "gave up with damage in sight"},
    {"ext4", "e2fsck/journal-skipped", 0, Verdict::Inconclusive, 1, "it may put the count right"},
    {"ext4", "e2fsck/external-journal-missing", 12, Verdict::Inconclusive, 1, "half is not here"},
    {"ext4", "e2fsck/no-superblock", 8, Verdict::Damaged, 3, "none where there was one"},
    {"ext4", "e2fsck/crashed", 8, Verdict::Failed, 1, "a crash is no answer"},
    {"ext4", "e2fsck/cancelled", 32, Verdict::Stopped, 0, "interrupted, and not by us"},
    {"vfat", "fsck.fat/sound", 0, Verdict::Sound, 0, "nothing found"},
    {"vfat", "fsck.fat/dirty", 1, Verdict::Damaged, 1, "a repair would take the mark off"},
    {"vfat", "fsck.fat/lost", 1, Verdict::Damaged, 1, "a chain without a name"},
    {"vfat", "fsck.fat/wrong-size", 1, Verdict::Damaged, 1, "below the path of the file"},
    {"vfat", "fsck.fat/tables-differ", 1, Verdict::Damaged, 2, "and a chain in one of them"},
    {"vfat", "fsck.fat/uninitialised-count", 0, Verdict::Sound, 0, "a count may be missing"},
    {"vfat", "fsck.fat/boot-sectors-differ", 0, Verdict::Sound, 0, "harmless, says the tool"},
    {"vfat", "fsck.fat/no-fat", 1, Verdict::Failed, 0, "1 is its answer to what is no FAT as well"},
    {"exfat", "fsck.exfat/sound", 0, Verdict::Sound, 0, "nothing found"},
    {"exfat", "fsck.exfat/bad-file", 4, Verdict::Damaged, 3, "says so"},
    {"exfat", "fsck.exfat/no-root", 4, Verdict::Damaged, 2, "although it says \"clean\""},
    {"exfat", "fsck.exfat/debian13-bad-file", 4, Verdict::Damaged, 3, "other numbers in its lines"},
    {"exfat", "fsck.exfat/debian13-upcase", 4, Verdict::Damaged, 2, "asks; 1.2.0 gave up"},
    {"exfat", "fsck.exfat/bad-boot-checksum", 4, Verdict::Damaged, 2, "and it gave up there"},
    {"exfat", "fsck.exfat/no-boot-sector", 8, Verdict::Damaged, 1, "it says why it gave up"},
    {"ntfs", "ntfs/sound", 0, Verdict::Sound, 0, "nothing found"},
    {"ntfs", "ntfs/sound", 1, Verdict::Sound, 0, "too full to be made smaller is no damage"},
    {"ntfs", "ntfs/map", 1, Verdict::Damaged, 11, "the map of what is in use is wrong"},
    {"ntfs", "ntfs/mirror", 1, Verdict::Damaged, 1, "the copy of the first records differs"},
    {"ntfs", "ntfs/no-boot-sector", 1, Verdict::Damaged, 1, "it says why it gave up"},
    {"xfs", "xfs_repair/sound", 0, Verdict::Sound, 0, "nothing found"},
    {"xfs", "xfs_repair/count", 1, Verdict::Damaged, 1, "a wrong count"},
    {"xfs", "xfs_repair/links", 1, Verdict::Damaged, 1, "a wrong count of links"},
    {"xfs", "xfs_repair/debian13-lost-directory", 1, Verdict::Damaged, 13, "some on one line"},
    {"xfs", "xfs_repair/log", 1, Verdict::Inconclusive, 0, "the log is to be replayed first"},
    {"xfs", "xfs_repair/no-superblock", 1, Verdict::Damaged, 3, "it cannot go on"},
    {"xfs", "xfs_repair/external-log", 1, Verdict::Inconclusive, 0, "half of it is not here"},
    {"btrfs", "btrfs/sound", 0, Verdict::Sound, 0, "nothing found"},
    {"btrfs", "btrfs/one-copy", 0, Verdict::Damaged, 1, "0, as the other copy is good"},
    {"btrfs", "btrfs/no-tree", 1, Verdict::Damaged, 4, "both copies are damaged"},
    {"btrfs", "btrfs/missing-disk", 0, Verdict::Inconclusive, 0, "0, with half of it missing"},
    {"btrfs", "btrfs/debian13-sound", 0, Verdict::Sound, 0, "eight steps, the first is the log"},
    {"btrfs", "btrfs/debian13-one-copy", 0, Verdict::Damaged, 1, "eight steps"},
    {"btrfs", "btrfs/debian13-missing-disk", 0, Verdict::Inconclusive, 0, "eight steps"},
    {"f2fs", "fsck.f2fs/sound", 0, Verdict::Sound, 0, "nothing found"},
    {"f2fs", "fsck.f2fs/segments", 1, Verdict::Damaged, 2, "a wrong count of a segment"},
    {"f2fs", "fsck.f2fs/lost-nodes", 255, Verdict::Damaged, 7, "it asked, and nobody answered"},
    {"f2fs", "fsck.f2fs/no-checkpoint", 255, Verdict::Damaged, 3, "it cannot go on"},
    {"f2fs", "fsck.f2fs/no-first-superblock", 0, Verdict::Damaged, 2, "0, as the second is good"},
};

TEST(ToolVerdict, OfRecordedVerifications)
{
    for (const Case& c : verifications) {
        const Tool& tool = *toolFor(c.filesystem);
        const auto lines = recordedLines(c.recording);
        EXPECT_EQ(judge(tool, lines, Exited{c.status}).verdict, c.verdict)
            << c.recording << ": " << c.because;
        EXPECT_EQ(readAll(tool, lines).problems().size(), c.problems) << c.recording;
    }
}

TEST(ToolVerdict, TruncatedOutputNeverReadsAsSound)
{
    const auto expectNeverSound = [](std::string_view filesystem, std::string_view recording) {
        // What stands behind the line that ends the check itself: advice, or a tally.
        const std::size_t behind = filesystem == "ntfs"    ? 3
                                   : filesystem == "btrfs" ? 7
                                   : filesystem == "ext4"  ? 0
                                                           : 1;
        const auto all = recordedLines(recording);
        for (std::size_t kept = 0; kept + behind < all.size(); ++kept) {
            const std::vector<std::string> lines(all.begin(),
                                                 all.begin() + static_cast<std::ptrdiff_t>(kept));
            EXPECT_NE(judge(*toolFor(filesystem), lines, Exited{0}).verdict, Verdict::Sound)
                << recording << " after " << kept << " lines";
        }
    };
    for (const Case& c : verifications)
        expectNeverSound(c.filesystem, c.recording);
    for (const std::string& recording : test::recordingsOfE2fsck())
        expectNeverSound("ext4", recording);
}

TEST(ToolVerdict, OnlyACleanExitIsSound)
{
    for (const Case& c : verifications) {
        if (c.verdict != Verdict::Sound || c.filesystem == "ntfs")
            continue;
        const Tool& tool = *toolFor(c.filesystem);
        const auto lines = recordedLines(c.recording);
        for (int status = 1; status < 256; ++status)
            EXPECT_NE(judge(tool, lines, Exited{status}).verdict, Verdict::Sound) << status;
        for (const Ending& ending : {Ending(Killed{SIGKILL}), Ending(NotStarted{ENOENT})})
            EXPECT_EQ(judge(tool, lines, ending).verdict, Verdict::Failed) << c.recording;
    }
    EXPECT_EQ(judge(*toolFor("ext4"), {"The volume “image” appears to be OK."}, Exited{4}).verdict,
              Verdict::Damaged)
        << "it lies in words";
}

// What the tools do not say, or do not know.
TEST(ToolVerdict, WeighsWhatWeKnowBesides)
{
    struct Doubt {
        void (*apply)(VolumeFacts& volume);
        bool concernsExt;
        Verdict verdict;
    };
    const Doubt doubts[] = {
        {[](VolumeFacts& v) { v.availableBytes -= 1; }, true, Verdict::Damaged},
        {[](VolumeFacts& v) { v.hasPrimary = false; }, false, Verdict::Damaged},
        {[](VolumeFacts& v) { v.needsRecovery = true; }, true, Verdict::Inconclusive},
    };
    for (const Case& c : verifications)
        for (const Doubt& doubt : doubts) {
            // e2fsck says itself that it took a copy.
            if (c.verdict != Verdict::Sound || (c.filesystem == "ext4" && !doubt.concernsExt))
                continue;
            VolumeFacts volume = plainVolume();
            doubt.apply(volume);
            EXPECT_EQ(judge(*toolFor(c.filesystem), recordedLines(c.recording), Exited{0}, volume)
                          .verdict,
                      doubt.verdict)
                << c.recording << ": " << &doubt - doubts;
        }
}

TEST(ToolVerdict, WhatARunHadFoundBeforeItWasEndedStands)
{
    for (const Tool* const tool : allTools()) {
        RunEvidence evidence{
            Access::ReadOnly, {Killed{SIGINT}, StopCause::TooMuchOutput}, {}, plainVolume()};
        EXPECT_EQ(tool->judge(evidence).code, contract::kPLErrorToolMisbehaved) << tool->name;
        evidence.findings.problems = 1;
        EXPECT_EQ(tool->judge(evidence).verdict, Verdict::Damaged) << tool->name;
        evidence.result.cause = StopCause::User;
        EXPECT_EQ(tool->judge(evidence).verdict, Verdict::Stopped) << tool->name;
        evidence.result = {Exited{8}, StopCause::None};
        evidence.findings = {};
        evidence.findings.foundDiskInUse = true;
        EXPECT_EQ(tool->judge(evidence).code, contract::kPLErrorDiskInUse) << tool->name;
    }
}

// Mounting makes anew what they tell of; for the quotas it exits with 1.
TEST(ToolVerdict, RemarksOfBtrfsAreNoDamage)
{
    const Tool& btrfs = *toolFor("btrfs");
    auto lines = recordedLines("btrfs/sound");
    const auto insert = [&lines](std::string line) {
        lines.insert(lines.begin() + 3, std::move(line));
    };
    insert("cache and super generation don't match, space cache will be invalidated");
    EXPECT_EQ(judge(btrfs, lines, Exited{0}).verdict, Verdict::Sound);
    EXPECT_EQ(judge(btrfs, lines, Exited{1}).verdict, Verdict::Damaged);
    insert("Rescan hasn't been initialized, a difference in qgroup accounting is expected");
    EXPECT_EQ(judge(btrfs, lines, Exited{1}).verdict, Verdict::Sound);
    insert("checksum verify failed on 22036480 wanted 0x00000000 found 0x12345678");
    EXPECT_EQ(judge(btrfs, lines, Exited{1}).verdict, Verdict::Damaged);
}

// Some say so plainly; of the others the kernel is asked.
TEST(ToolVerdict, WhatCannotBeReadIsNotDamaged)
{
    struct Fault {
        std::string_view filesystem;
        std::string line;
        Verdict verdict;
        std::optional<ReadFault> fault;
    };
    const ReadFault somewhere;
    const ReadFault perhaps{std::nullopt, std::nullopt, true};
    const ReadFault inBlock{std::nullopt, 357, false};
    const ReadFault atEnd{std::nullopt, 9, true};
    const ReadFault atByte{16384, std::nullopt, false};
    const ReadFault atLastByte{16484, std::nullopt, true};
    const std::string unread = "Input/output error";
    for (const Fault& c : {
             Fault{"ext4", "Error reading block 357 (" + unread + ").  Ignore error? no",
                   Verdict::Failed, inBlock},
             Fault{"ext4",
                   "Error reading block 9 (Attempt to read block from filesystem resulted in short "
                   "read) while reading inode and block bitmaps.  Ignore error? no",
                   Verdict::Damaged, atEnd},
             Fault{"ext4", "DISK: " + unread + " reading journal superblock", Verdict::Failed,
                   somewhere},
             Fault{"ext4",
                   "Entry '" + unread + "' in / (2) is a link to '.'  Clear? no",
                   Verdict::Damaged,
                   {}},
             Fault{"vfat", "Read 512 bytes at 16384:" + unread, Verdict::Failed, atByte},
             Fault{"vfat", "Got 100 bytes instead of 512 at 16384", Verdict::Failed, atLastByte},
             Fault{"exfat", "failed to read bitmap", Verdict::Damaged, perhaps},
             Fault{"ntfs", "ntfs_attr_pread_i: ntfs_pread failed: " + unread, Verdict::Failed,
                   somewhere},
             Fault{"xfs", "xfs_repair: read failed: " + unread, Verdict::Failed, somewhere},
             Fault{"btrfs", "Error reading 22036480, -1", Verdict::Failed, somewhere},
             Fault{"f2fs",
                   "[ASSERT] (get_current_sit_page:2054) dev_read_block(sit_blk, blk_addr) >= 0",
                   Verdict::Damaged, perhaps},
         }) {
        const Tool& tool = *toolFor(c.filesystem);
        EXPECT_EQ(readAll(tool, {c.line}).findings.readFault, c.fault) << c.line;
        EXPECT_EQ(judge(tool, {c.line}, Exited{1}).verdict, c.verdict) << c.line;
    }
}

TEST(ToolFindings, FilesThatARepairTakesAwayOrShortensAreNamed)
{
    using Changes = std::vector<FileChange>;
    constexpr auto unknown = std::nullopt;
    struct Said {
        std::string_view filesystem;
        std::vector<std::string> lines;
        Changes changes;
    };
    const std::string cut =
        "ERROR: /a: b: less clusters are allocated. truncates to 4096 bytes at 0x1180";
    const std::string kept =
        "ERROR: /a: more clusters are allocated. truncate to 4096 bytes at 0x1180";
    for (const Said& c : {
             Said{"vfat", test::recordedLines("fsck.fat/repaired"), {{0, "/FILE.TXT", 5000, 2048}}},
             Said{"vfat",
                  {"/LONG.TXT", "  File size is 2048 bytes, cluster chain length is > 2048 bytes.",
                   "  Truncating file to 2048 bytes."},
                  {}},
             Said{"vfat", {"  Truncating file to 2048 bytes."}, {}},
             Said{"exfat", {cut + ". Truncate (y/N)? y"}, {{0, "/a: b", unknown, 4096}}},
             Said{"exfat", {cut + ". Truncate (y/N)? n", kept + ". Truncate (y/N)? y"}, {}},
             Said{"xfs",
                  {"cleared inode 133", "would have cleared inode 134",
                   "junking entry \"a \"b\" in directory inode 128",
                   "would have junked entry \"c\" in directory inode 128"},
                  {{133, "", unknown, unknown}, {0, "a \"b", unknown, unknown}}},
         })
        EXPECT_EQ(readAll(*toolFor(c.filesystem), c.lines).findings.changes, c.changes)
            << c.lines.front();
}

// What was named before stands, unless a log may put it right.
TEST(ToolVerdict, ACrashDoesNotUndoWhatWasFound)
{
    VolumeFacts waiting = plainVolume();
    waiting.needsRecovery = true;
    for (const auto& [filesystem, line] : std::map<std::string_view, std::string>{
             {"ext4", "Free blocks count wrong (1, counted=40914).  Fix? no"},
             {"vfat", "Dirty bit is set. Fs was not properly unmounted"},
             {"xfs", "agi unlinked bucket 3 is 131 in ag 0"}}) {
        const Tool& tool = *toolFor(filesystem);
        const Ending crash = Killed{SIGSEGV};
        EXPECT_EQ(judge(tool, {line}, crash).verdict, Verdict::Damaged) << filesystem;
        EXPECT_EQ(judge(tool, {}, crash).verdict, Verdict::Failed) << filesystem;
        EXPECT_EQ(judge(tool, {line}, crash, waiting).verdict, Verdict::Failed) << filesystem;
    }
    EXPECT_EQ(judge(*toolFor("ext4"),
                    {"Unattached inode 12", "Connect to /lost+found? no",
                     "Signal (11) SIGSEGV si_code=SEGV_MAPERR fault addr=0x8"},
                    Exited{8})
                  .verdict,
              Verdict::Damaged)
        << "it caught it itself";
}

TEST(ToolVerdict, OfRepairingRuns)
{
    struct Repair {
        std::string_view filesystem;
        std::string_view recording;
        int status;
        bool madeProgress;
    };
    for (const Repair& c :
         {Repair{"ext4", "e2fsck/repaired", 1, true}, Repair{"ext4", "e2fsck/repaired", 3, true},
          Repair{"ext4", "e2fsck/sound", 0, false},
          Repair{"ext4", "e2fsck/no-superblock", 8, false},
          Repair{"vfat", "fsck.fat/repaired", 1, true}, Repair{"vfat", "fsck.fat/no-fat", 1, false},
          Repair{"exfat", "fsck.exfat/repaired", 1, true},
          Repair{"exfat", "fsck.exfat/debian13-upcase-repaired", 1, true},
          Repair{"exfat", "fsck.exfat/no-root", 4, false},
          Repair{"ntfs", "ntfs/ntfsfix-mirror", 0, true},
          Repair{"ntfs", "ntfs/ntfsfix-nothing", 0, false},
          Repair{"xfs", "xfs_repair/repaired", 0, true},
          Repair{"xfs", "xfs_repair/log-first", 2, false},
          Repair{"f2fs", "fsck.f2fs/repaired", 1, true},
          Repair{"f2fs", "fsck.f2fs/lost-nodes", 255, false}}) {
        const Judgement judgement = judge(*toolFor(c.filesystem), recordedLines(c.recording),
                                          Exited{c.status}, plainVolume(), Access::ReadWrite);
        EXPECT_EQ(judgement.madeProgress, c.madeProgress) << c.recording;
    }
}

TEST(ToolArguments, OnlyARepairMayWrite)
{
    // Each tool's word for "change nothing", or its options that read only.
    const std::map<std::string_view, std::string> readOnly{
        {"e2fsck", "-n"},          {"fsck.fat", "-n"},   {"fsck.exfat", "-n"},
        {"ntfsresize", "-i"},      {"xfs_repair", "-n"}, {"btrfs", "--readonly"},
        {"fsck.f2fs", "--dry-run"}};
    // Every option of any of them that lets it write.
    const std::vector<std::string> writing{"-y", "-p", "-a", "-D", "-c", "-l",
                                           "-L", "-z", "-w", "-r", "-s", "--repair"};
    for (const Tool* const tool : allTools())
        for (const std::uint64_t offset : {0U, 4096U}) {
            const auto verify = tool->arguments(Access::ReadOnly, "/proc/self/fd/3", offset);
            EXPECT_EQ(std::ranges::count(verify, readOnly.at(tool->name)), 1) << tool->name;
            for (const std::string& option : writing)
                EXPECT_EQ(std::ranges::count(verify, option), 0) << tool->name << option;
            EXPECT_TRUE(verify.back().starts_with("/proc/self/fd/3")) << tool->name;
            const auto repair = tool->arguments(Access::ReadWrite, "/proc/self/fd/3", offset);
            const bool isSameProgram =
                tool->repairs(RepairWay::TriedFirst) && tool->repairName == tool->name;
            EXPECT_TRUE(!isSameProgram || std::ranges::count(repair, readOnly.at(tool->name)) == 0)
                << tool->name;
        }
}

TEST(ToolOutput, ProgressIsToldAndNotShown)
{
    const auto reading = readAll(*toolFor("ntfs"), recordedLines("ntfs/sound"));
    std::vector<double> percents;
    for (const ToolLine& line : reading.lines)
        if (line.kind == ToolLine::Kind::Progress)
            percents.push_back(line.percent);
    EXPECT_EQ(percents, (std::vector<double>{0, 100}));
}

TEST(ToolOutput, AnyBytesAreRead)
{
    std::mt19937 random(1);
    for (const Tool* const tool : allTools()) {
        std::vector<std::string> lines;
        for (int i = 0; i < 300; ++i) {
            std::string line(random() % 60, '\0');
            for (char& c : line)
                c = static_cast<char>(random());
            lines.push_back(line);
        }
        EXPECT_NE(judge(*tool, lines, Exited{0}).verdict, Verdict::Sound) << tool->name;
    }
}

Judgement judgeScrub(const std::vector<std::string>& lines, Ending ending,
                     StopCause cause = StopCause::None, std::size_t disks = 1)
{
    ScrubReport report;
    for (const std::string& line : lines)
        readScrubLine(line, report);
    return judgeScrub({ending, cause}, report, disks);
}

TEST(ScrubVerdict, OfWhatBtrfsScrubReallyPrinted)
{
    constexpr auto noCopy = "without any good copy";
    for (const auto& [recording, ending, verdict, says] :
         {std::tuple("sound", Ending(Exited{0}), Verdict::Sound, ""),
          {"two-disks", Exited{0}, Verdict::Sound, ""},
          {"file", Exited{3}, Verdict::Damaged, noCopy},
          {"one-copy", Exited{0}, Verdict::Damaged, "another, good copy"},  // nothing was corrected
          {"no-copy", Exited{3}, Verdict::Damaged, noCopy},
          {"file-and-copy", Exited{3}, Verdict::Damaged, noCopy},  // the worse of the two
          {"superblock", Exited{0}, Verdict::Damaged, ""},
          {"missing-disk", Exited{0}, Verdict::Inconclusive, "another disk"},
          {"debian13-sound", Exited{0}, Verdict::Sound, ""},
          {"debian13-two-disks", Exited{0}, Verdict::Sound, ""},
          {"debian13-file", Exited{3}, Verdict::Damaged, noCopy},
          {"debian13-one-copy", Exited{0}, Verdict::Damaged, "another, good copy"},
          {"debian13-missing-disk", Exited{0}, Verdict::Inconclusive, "another disk"},
          {"other", Exited{1}, Verdict::Failed, "another program is"},
          {"other-unrecorded", Exited{1}, Verdict::Failed, "another program is"},
          {"stopped", Exited{1}, Verdict::Failed, "another program has ended"},
          {"no-right", Exited{1}, Verdict::Failed, "could not do its work"},
          {"sound", Killed{9}, Verdict::Failed, "was killed"},
          {"sound", Exited{3}, Verdict::Damaged, ""}}) {
        const Judgement judgement =
            judgeScrub(recordedLines("btrfs-scrub/" + std::string(recording)), ending,
                       StopCause::None, std::string_view(recording).ends_with("two-disks") ? 2 : 1);
        EXPECT_EQ(judgement.verdict, verdict) << recording;
        EXPECT_NE(judgement.reason.key.find(says), std::string_view::npos)
            << recording << ": " << judgement.reason.key;
    }
    EXPECT_EQ(judgeScrub(recordedLines("btrfs-scrub/stopped"), Exited{1}, StopCause::User).verdict,
              Verdict::Stopped);
}

TEST(ScrubVerdict, OutputThatIsCutShortIsNeverSound)
{
    for (const std::size_t disks : {1U, 2U}) {
        auto lines = recordedLines(disks == 1 ? "btrfs-scrub/sound" : "btrfs-scrub/two-disks");
        while (!lines.empty()) {
            lines.pop_back();
            EXPECT_NE(judgeScrub(lines, Exited{0}, StopCause::None, disks).verdict, Verdict::Sound)
                << disks << " disks, " << lines.size() << " lines";
        }
    }
}

}  // namespace
