// SPDX-License-Identifier: Apache-2.0
#include "pellar/process/ProcessOutput.h"
#include "pellar/tools/ToolTable.h"
#include "tests/pellar/Recorded.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <iterator>
#include <map>
#include <random>

namespace {

using namespace pellar;

/// The lines as a run would tell them: what a tool writes over itself is two lines.
std::vector<std::string> linesOf(const std::filesystem::path& recording)
{
    std::ifstream file(recording, std::ios::binary);
    if (!file)
        throw std::runtime_error("no recording " + recording.string());
    std::vector<std::string> lines;
    LineSplitter splitter(4096,
                          [&lines](std::string_view line, bool) { lines.emplace_back(line); });
    splitter.take(std::string(std::istreambuf_iterator<char>(file), {}));
    splitter.finish();
    return lines;
}

std::filesystem::path recordingOf(std::string_view name)
{
    return std::filesystem::path(PELLAR_RECORDED_DIRECTORY) / (std::string(name) + ".txt");
}

test::Reading readAll(const Tool& tool, const std::vector<std::string>& lines)
{
    const auto reader = tool.makeReader();
    test::Reading reading;
    for (const std::string& line : lines)
        reader->read(line, reading.lines);
    reader->finish(reading.lines);
    reading.findings = reader->findings();
    return reading;
}

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

std::size_t problemsIn(const test::Reading& reading)
{
    return static_cast<std::size_t>(
        std::count_if(reading.lines.begin(), reading.lines.end(),
                      [](const ToolLine& line) { return line.kind == ToolLine::Kind::Problem; }));
}

TEST(ToolVerdict, OfRecordedVerifications)
{
    for (const Case& c : verifications) {
        const Tool& tool = *toolFor(c.filesystem);
        const auto lines = linesOf(recordingOf(c.recording));
        EXPECT_EQ(judge(tool, lines, Exited{c.status}).verdict, c.verdict)
            << c.recording << ": " << c.because;
        const auto reading = readAll(tool, lines);
        EXPECT_EQ(problemsIn(reading), c.problems) << c.recording << ": " << c.because;
        EXPECT_EQ(reading.findings.problems, c.problems) << c.recording;
    }
}

TEST(ToolVerdict, TruncatedOutputNeverReadsAsSound)
{
    for (const Case& c : verifications) {
        const Tool& tool = *toolFor(c.filesystem);
        const auto all = linesOf(recordingOf(c.recording));
        // What stands behind the line that ends the check itself: advice, or a tally.
        const std::size_t behind = c.filesystem == "ntfs" ? 3 : c.filesystem == "btrfs" ? 7 : 1;
        for (std::size_t kept = 0; kept + behind < all.size(); ++kept) {
            const std::vector<std::string> lines(all.begin(),
                                                 all.begin() + static_cast<std::ptrdiff_t>(kept));
            EXPECT_NE(judge(tool, lines, Exited{0}).verdict, Verdict::Sound)
                << c.recording << " after " << kept << " lines";
        }
    }
}

TEST(ToolVerdict, OnlyACleanExitIsSound)
{
    for (const Case& c : verifications) {
        if (c.verdict != Verdict::Sound || c.filesystem == "ntfs")
            continue;
        const Tool& tool = *toolFor(c.filesystem);
        const auto lines = linesOf(recordingOf(c.recording));
        for (int status = 1; status < 256; ++status)
            EXPECT_NE(judge(tool, lines, Exited{status}).verdict, Verdict::Sound) << status;
        for (const Ending& ending : {Ending(Killed{SIGKILL}), Ending(NotStarted{ENOENT})})
            EXPECT_EQ(judge(tool, lines, ending).verdict, Verdict::Failed) << c.recording;
    }
}

// What the tools do not say, or do not know.
TEST(ToolVerdict, WeighsWhatWeKnowBesides)
{
    struct Doubt {
        void (*apply)(VolumeFacts& volume);
        Verdict verdict;
        std::string_view because;
    };
    const Doubt doubts[] = {
        {[](VolumeFacts& v) { v.availableBytes -= 1; }, Verdict::Damaged, "its end is missing"},
        {[](VolumeFacts& v) { v.hasPrimary = false; }, Verdict::Damaged, "a copy was taken"},
        {[](VolumeFacts& v) { v.needsRecovery = true; }, Verdict::Inconclusive, "a log waits"},
    };
    for (const Case& c : verifications)
        for (const Doubt& doubt : doubts) {
            if (c.verdict != Verdict::Sound)
                continue;
            VolumeFacts volume = plainVolume();
            doubt.apply(volume);
            EXPECT_EQ(
                judge(*toolFor(c.filesystem), linesOf(recordingOf(c.recording)), Exited{0}, volume)
                    .verdict,
                doubt.verdict)
                << c.recording << ": " << doubt.because;
        }
}

// Mounting makes anew what they tell of; for the quotas it exits with 1.
TEST(ToolVerdict, RemarksOfBtrfsAreNoDamage)
{
    const Tool& btrfs = *toolFor("btrfs");
    auto lines = linesOf(recordingOf("btrfs/sound"));
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
        std::vector<std::string> lines;
        Verdict verdict;
        std::optional<ReadFault> fault;
    };
    const ReadFault somewhere;
    const ReadFault perhaps{std::nullopt, std::nullopt, true};
    for (const Fault& c :
         {Fault{"ext4",
                {"Error reading block 357 (Input/output error).  Ignore error? no"},
                Verdict::Failed,
                ReadFault{std::nullopt, 357, false}},
          Fault{"ext4",
                {"Error reading block 9 (Attempt to read block from filesystem resulted in short "
                 "read) while reading inode and block bitmaps.  Ignore error? no"},
                Verdict::Damaged,
                ReadFault{std::nullopt, 9, true}},
          Fault{"ext4",
                {"DISK: Input/output error reading journal superblock"},
                Verdict::Failed,
                somewhere},
          Fault{"ext4",
                {"Entry 'Input/output error' in / (2) is a link to '.'  Clear? no"},
                Verdict::Damaged,
                std::nullopt},
          Fault{"vfat",
                {"Read 512 bytes at 16384:Input/output error"},
                Verdict::Failed,
                ReadFault{16384, std::nullopt, false}},
          Fault{"vfat",
                {"Got 100 bytes instead of 512 at 16384"},
                Verdict::Failed,
                ReadFault{16484, std::nullopt, true}},
          Fault{"exfat", {"failed to read bitmap"}, Verdict::Damaged, perhaps},
          Fault{"ntfs",
                {"ntfs_attr_pread_i: ntfs_pread failed: Input/output error"},
                Verdict::Failed,
                somewhere},
          Fault{"xfs", {"xfs_repair: read failed: Input/output error"}, Verdict::Failed, somewhere},
          Fault{"btrfs", {"Error reading 22036480, -1"}, Verdict::Failed, somewhere},
          Fault{"f2fs",
                {"[ASSERT] (get_current_sit_page:2054) dev_read_block(sit_blk, blk_addr) >= 0"},
                Verdict::Damaged,
                perhaps}}) {
        const Tool& tool = *toolFor(c.filesystem);
        EXPECT_EQ(readAll(tool, c.lines).findings.readFault, c.fault) << c.lines.front();
        EXPECT_EQ(judge(tool, c.lines, Exited{1}).verdict, c.verdict) << c.lines.front();
    }
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

TEST(ToolVerdict, AMarkOfImproperUnmountingIsNeverSound)
{
    VolumeFacts marked = plainVolume();
    marked.isMarkedDirty = true;
    const auto verdictOf = [&marked](std::string_view filesystem, std::string_view recording) {
        return judge(*toolFor(filesystem), linesOf(recordingOf(recording)), Exited{0}, marked)
            .verdict;
    };
    EXPECT_EQ(verdictOf("exfat", "fsck.exfat/sound"), Verdict::Damaged)
        << "fsck.exfat pays no heed to it, and takes it off";
    EXPECT_EQ(verdictOf("ntfs", "ntfs/sound"), Verdict::Inconclusive)
        << "only its own system can deal with it";
}

TEST(ToolVerdict, OfRepairingRuns)
{
    struct Repair {
        std::string_view filesystem;
        std::string_view recording;
        int status;
        bool madeProgress;
        std::string_view because;
    };
    for (const Repair& c :
         {Repair{"vfat", "fsck.fat/repaired", 1, true, "it says that it has written"},
          Repair{"vfat", "fsck.fat/no-fat", 1, false, "it says 1 all the same"},
          Repair{"exfat", "fsck.exfat/repaired", 1, true, "corrected"},
          Repair{"exfat", "fsck.exfat/debian13-repaired", 1, true, "other numbers in its lines"},
          Repair{"exfat", "fsck.exfat/debian13-upcase-repaired", 1, true, "1.2.0 gave up"},
          Repair{"exfat", "fsck.exfat/no-root", 4, false, "it got nowhere"},
          Repair{"ntfs", "ntfs/ntfsfix-mirror", 0, true, "corrected"},
          Repair{"ntfs", "ntfs/ntfsfix-nothing", 0, false, "0, and nothing was done"},
          Repair{"xfs", "xfs_repair/repaired", 0, true, "it never says more"},
          Repair{"xfs", "xfs_repair/log-first", 2, false, "it refused"},
          Repair{"f2fs", "fsck.f2fs/repaired", 1, true, "it came to its end"},
          Repair{"f2fs", "fsck.f2fs/lost-nodes", 255, false, "it gave up"}}) {
        const Judgement judgement = judge(*toolFor(c.filesystem), linesOf(recordingOf(c.recording)),
                                          Exited{c.status}, plainVolume(), Access::ReadWrite);
        EXPECT_EQ(judgement.madeProgress, c.madeProgress) << c.recording << ": " << c.because;
    }
}

TEST(ToolVerdict, StoppedIsStopped)
{
    for (const Tool* const tool : allTools()) {
        RunEvidence evidence{Access::ReadOnly, {Exited{0}, StopCause::User}, {}, plainVolume()};
        EXPECT_EQ(tool->judge(evidence).verdict, Verdict::Stopped) << tool->name;
    }
}

TEST(ToolArguments, OnlyARepairMayWrite)
{
    // Each tool's word for "change nothing", or its options that read only.
    const std::map<std::string_view, std::string> readOnly{
        {"e2fsck", "-n"},          {"fsck.fat", "-n"},   {"fsck.exfat", "-n"},
        {"ntfsresize", "-i"},      {"xfs_repair", "-n"}, {"btrfs", "--readonly"},
        {"fsck.f2fs", "--dry-run"}};
    for (const Tool* const tool : allTools()) {
        const auto verify = tool->arguments(Access::ReadOnly, "/proc/self/fd/3", 0);
        EXPECT_EQ(std::count(verify.begin(), verify.end(), readOnly.at(tool->name)), 1)
            << tool->name;
        EXPECT_EQ(verify.back(), "/proc/self/fd/3");
        const auto repair = tool->arguments(Access::ReadWrite, "/proc/self/fd/3", 0);
        const bool isSameProgram = tool->canRepair() && tool->repairName == tool->name;
        EXPECT_TRUE(!isSameProgram ||
                    std::count(repair.begin(), repair.end(), readOnly.at(tool->name)) == 0)
            << tool->name;
    }
}

TEST(ToolOutput, ProgressIsToldAndNotShown)
{
    const auto reading = readAll(*toolFor("ntfs"), linesOf(recordingOf("ntfs/sound")));
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

}  // namespace
