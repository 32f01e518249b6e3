// SPDX-License-Identifier: Apache-2.0
#include "contract/pellar/ErrorCodes.h"
#include "tests/pellar/Workshop.h"

#include <gtest/gtest.h>
#include <sys/wait.h>

#include <algorithm>
#include <cerrno>
#include <utility>

namespace {

using namespace std::chrono_literals;
using namespace pellar;

const std::string soundRun =
    "say Pass 1: Checking inodes, blocks, and sizes\n"
    "say Disk: 11/2048 files (9.1% non-contiguous), 1618/8192 blocks\n";

/// Jobs on a sound volume with a tool that does what a script says.
struct Stage {
    explicit Stage(std::string_view script, ManagerOptions options = {})
        : disk(test::reference(workshop.makeExt("disk", 8U << 20U))), bench([&] {
              options.toolPath = workshop.fakeTools(script);
              return options;
          }())
    {
    }

    test::Workshop workshop;
    contract::DiskReferencePointer disk;
    test::Bench bench;
    test::Listener& heard = bench.listener;
};

void expectOneEnd(Stage& stage)
{
    stage.bench.loop.drain();
    EXPECT_EQ(stage.heard.started, 1);
    EXPECT_EQ(stage.heard.finished, 1);
    EXPECT_EQ(stage.heard.callsAfterFinished, 0);
    EXPECT_EQ(::waitpid(-1, nullptr, WNOHANG), -1) << "a process is left";
}

ManagerOptions fewLines()
{
    ManagerOptions options;
    options.outputLimits = {1000, 10U << 20U};
    return options;
}

TEST(Job, VerifyAnswersWhatIsTrue)
{
    struct Case {
        std::string script;
        contract::ErrorCode error;
        std::string_view verdict;
        std::string_view because;
    };
    for (const Case& c :
         {Case{soundRun, 0, "sound", "all is said"},
          Case{"say Pass 1: Checking inodes, blocks, and sizes\n", contract::kPLErrorInconclusive,
               "inconclusive", "it never came to the end"},
          Case{"", contract::kPLErrorInconclusive, "inconclusive", "it said nothing"},
          Case{soundRun + "exit 16", contract::kPLErrorToolFailed, "failed", "usage"},
          Case{soundRun + "kill 9", contract::kPLErrorToolFailed, "failed", "killed"},
          Case{soundRun + "shrink 4194304", contract::kPLErrorDiskChanged, "failed",
               "the file shrank below it"},
          Case{"flood-lines", contract::kPLErrorDamaged, "damaged", "problems without end"},
          Case{"flood-bytes", contract::kPLErrorToolMisbehaved, "failed", "noise without end"}}) {
        Stage stage(c.script, fewLines());
        // The claim is read-only, so the tool needs write access of its own to cut the file.
        EXPECT_EQ(stage.bench.verify(stage.disk), contract::kPLNoError) << c.because;
        EXPECT_EQ(stage.heard.error, c.error) << c.because;
        EXPECT_EQ(stage.heard.verdict, c.verdict) << c.because;
        EXPECT_FALSE(stage.heard.message.empty()) << c.because;
        expectOneEnd(stage);
    }
}

TEST(Job, ARepairIsEndedWhereTheDiskCannotBeRead)
{
    Stage stage(
        "say Free blocks count wrong (1, counted=2).  Fix? no\n"
        "say-in-repair Error reading block 5 (Input/output error).  Ignore error? yes\n"
        "await-in-repair never\nexit 4");
    ASSERT_EQ(stage.bench.repair(stage.disk), 0);
    EXPECT_EQ(stage.heard.error, contract::kPLErrorUnreadable) << stage.heard.message;
    EXPECT_EQ(stage.heard.verdict, "failed");
    expectOneEnd(stage);
}

TEST(Job, FloodIsEndedWithASentence)
{
    Stage stage("flood-lines", fewLines());
    ASSERT_EQ(stage.bench.verify(stage.disk), 0);
    EXPECT_EQ(stage.heard.textsOf(contract::kFsckFail).size(), 1U);
    EXPECT_EQ(stage.heard.textsOf(contract::kFsckError).size(), 11U) << "ten, and how many more";
}

TEST(Job, CancelIsHeardAndReported)
{
    Stage stage("ignore 2\nignore 15\nsay e2fsck 1.47.0\nwait");
    const auto press = [&stage] {
        stage.bench.tool->cancelCurrentOperation();
    };
    stage.heard.onMessage = [&] {
        for (int i = 0; stage.heard.hasPlainLine("e2fsck 1.47.0") && i < 3; ++i)
            press();
    };
    ASSERT_EQ(stage.bench.verify(stage.disk), 0);
    EXPECT_EQ(stage.heard.error, contract::kPLErrorCancelled);
    EXPECT_EQ(stage.heard.verdict, "stopped");
    press();  // nothing runs
    expectOneEnd(stage);
}

TEST(Job, DestroyingTheToolEndsEverything)
{
    for (const std::string_view script : {"wait", "flood-lines", "ignore 2\nignore 15\nwait"}) {
        Stage stage(script);
        ASSERT_EQ(stage.bench.tool->beginStoragesystemFilesystemVerifyForDisk(stage.disk), 0);
        while (stage.bench.loop.waiting() == 0)
            std::this_thread::yield();
        stage.bench.tool.reset();
        stage.bench.loop.drain();
        EXPECT_EQ(stage.heard.started + stage.heard.finished, 0) << script;
        EXPECT_EQ(::waitpid(-1, nullptr, WNOHANG), -1) << script;
        EXPECT_EQ(errno, ECHILD) << script;
    }
}

TEST(Job, MayBeDestroyedByTheOneWhoHearsIt)
{
    Stage stage("wait");
    stage.heard.onMessage = [&stage] {
        stage.bench.tool.reset();
    };
    ASSERT_EQ(stage.bench.tool->beginStoragesystemFilesystemVerifyForDisk(stage.disk), 0);
    ASSERT_TRUE(stage.bench.loop.runUntil([&stage] { return !stage.bench.tool; }));
    stage.bench.loop.drain();
    EXPECT_EQ(stage.heard.finished, 0);
}

TEST(Job, TheNextMayBeginInTheFinishedOfTheLast)
{
    Stage stage(soundRun);
    contract::ErrorCode second = -1;
    stage.heard.onFinished = [&] {
        if (stage.heard.finished == 1)
            second = stage.bench.tool->beginStoragesystemFilesystemRepairForDisk(stage.disk);
    };
    ASSERT_EQ(stage.bench.tool->beginStoragesystemFilesystemVerifyForDisk(stage.disk), 0);
    EXPECT_EQ(stage.bench.tool->beginStoragesystemFilesystemVerifyForDisk(stage.disk),
              contract::kPLErrorBusy);
    ASSERT_TRUE(stage.bench.loop.runUntil([&] { return stage.heard.finished == 2; }));
    EXPECT_EQ(second, contract::kPLNoError);
    EXPECT_EQ(stage.heard.verdict, "sound");
}

TEST(Job, RefusesBeforeItStarts)
{
    Stage stage(soundRun);
    const auto begin = [&stage](const contract::DiskReference& disk) {
        return stage.bench.tool->beginStoragesystemFilesystemVerifyForDisk(
            std::make_shared<contract::DiskReference>(disk));
    };
    contract::DiskReference disk = *stage.disk;
    disk.isWhole = true;
    EXPECT_EQ(begin(disk), contract::kPLErrorUnsupported);
    disk = *stage.disk;
    disk.path.clear();
    EXPECT_EQ(begin(disk), contract::kPLErrorNoDiskReference);
    EXPECT_EQ(stage.bench.tool->beginStoragesystemFilesystemVerifyForDisk(nullptr),
              contract::kPLErrorNoDiskReference);
    stage.bench.loop.drain();
    EXPECT_EQ(stage.heard.started, 0) << "a refused begin calls nobody back";
}

// The log is the place where a reason can be read.
TEST(Job, SaysWhyThereIsNoWay)
{
    Stage stage(soundRun);
    std::filesystem::remove(stage.workshop.path("tools/e2fsck"));
    struct Case {
        std::string_view filesystem;
        contract::ErrorCode error;
        std::string_view says;
    };
    for (const Case& c :
         {Case{"%@fs", contract::kPLErrorUnsupported, "no tool for the file system “%@fs”"},
          Case{"swap", contract::kPLErrorUnsupported, "it is swap space"},
          Case{"crypto_LUKS", contract::kPLErrorUnsupported, "it is encrypted"},
          Case{"ext4", contract::kPLErrorToolMissing,
               "e2fsck is not installed (package e2fsprogs)"}}) {
        contract::DiskReference disk = *stage.disk;
        disk.filesystem = c.filesystem;
        ASSERT_EQ(stage.bench.repair(std::make_shared<contract::DiskReference>(disk)), 0);
        EXPECT_EQ(stage.heard.error, c.error) << c.filesystem;
        EXPECT_NE(stage.heard.message.find(c.says), std::string::npos) << stage.heard.message;
        EXPECT_FALSE(stage.bench.manager.canRepair(c.filesystem));
        EXPECT_NE(stage.bench.manager.reasonAgainst(c.filesystem, Operation::Repair).find(c.says),
                  std::string::npos);
    }
}

/// A FAT16 volume that a fake fsck.fat treats: what it says depends on whether it may write.
struct FatStage {
    explicit FatStage(std::string_view script)
    {
        workshop.write("disk", {});
        std::filesystem::resize_file(workshop.path("disk"), 20U << 20U);
        workshop.write("disk", fatBootSector());
        std::filesystem::resize_file(workshop.path("disk"), 20U << 20U);
        options.toolPath = workshop.fakeTools(script, "fsck.fat");
    }

    static std::string fatBootSector()
    {
        std::string sector(512, '\0');
        sector.replace(0, 24,
                       std::string("\xEB\x3C\x90mkfs.fat\0\2\4\4\0\2\0\2\0\xA0\xF8\x28\0", 24));
        return sector.replace(510, 2, "\x55\xAA");
    }

    test::Workshop workshop;
    ManagerOptions options;
};

const std::string fatDamage =
    "say FATs differ but appear to be intact.\n"
    "say /proc/self/fd/3: 2 files, 1/10211 clusters\n";

TEST(Job, IsToldThatAWritingToolComesToItsEndBeforeItStops)
{
    FatStage stage(fatDamage + "await-in-repair pressed\nsay the end\nexit 1");
    test::Bench bench(stage.options);
    bool isPressed = false;
    bench.listener.onMessage = [&] {
        // The look has shown it as a problem; the repair tells it as a plain line.
        if (!bench.listener.hasPlainLine("FATs differ") || std::exchange(isPressed, true))
            return;
        bench.tool->cancelCurrentOperation();
        stage.workshop.write("tools/pressed", "");
    };
    ASSERT_EQ(bench.repair(test::reference(stage.workshop.path("disk"), "vfat")), 0);
    EXPECT_EQ(bench.listener.verdict, "stopped");
    EXPECT_EQ(
        std::count(bench.listener.plainLines.begin(), bench.listener.plainLines.end(), "the end\n"),
        2)
        << "of the look, and of the repair";
    EXPECT_EQ(
        std::count_if(
            bench.listener.dictionaries.begin(), bench.listener.dictionaries.end(),
            [](const contract::Dictionary& message) {
                return message.string(contract::kFsckMessageString).find("fsck.fat is writing") !=
                       std::string::npos;
            }),
        1);
}

TEST(Job, ProblemsThatTheLookHasShownAreNotShownAgain)
{
    FatStage stage(fatDamage + "exit 1");
    test::Bench bench(stage.options);
    ASSERT_EQ(bench.repair(test::reference(stage.workshop.path("disk"), "vfat")), 0);
    EXPECT_EQ(bench.listener.verdict, "damaged") << "it never says that it has changed anything";
    EXPECT_EQ(bench.listener.textsOf(contract::kFsckError).size(), 2U)
        << "once before the repair, and once for what is left";
    EXPECT_EQ(bench.listener.textsOf(contract::kFsckRepair).size(), 1U) << "one pass is enough";
}

TEST(Job, ProgressOnlyGrows)
{
    Stage stage(
        "progress 1 1 4\nsleep 120\nprogress 1 3 4\nsleep 120\nprogress 2 1 2\n"
        "progress nonsense\n" +
        soundRun);
    ASSERT_EQ(stage.bench.repair(stage.disk), 0);
    const std::vector<double>& progress = stage.heard.progress;
    ASSERT_GE(progress.size(), 3U);
    EXPECT_TRUE(std::is_sorted(progress.begin(), progress.end()));
    EXPECT_GT(progress.front(), 0);
    EXPECT_LT(progress.back(), 100);
}

}  // namespace
