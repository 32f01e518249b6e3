// SPDX-License-Identifier: Apache-2.0
#include "contract/pellar/ErrorCodes.h"
#include "pellar/jobs/PartOfImageScript.h"
#include "pellar/tools/ToolTable.h"
#include "tests/pellar/JobFixture.h"

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
struct FakeToolFixture {
    explicit FakeToolFixture(std::string_view script, JobOptions options = {})
        : disk(test::reference(directory.makeExt("disk", 8U << 20U))), library([&] {
              options.toolPath = directory.fakeTools(script);
              return options;
          }())
    {
    }

    test::TestDirectory directory;
    contract::DiskReferencePointer disk;
    test::JobFixture library;
    test::Listener& heard = library.listener;
};

void expectOneEnd(FakeToolFixture& fixture)
{
    fixture.library.loop.drain();
    EXPECT_EQ(fixture.heard.started, 1);
    EXPECT_EQ(fixture.heard.finished, 1);
    EXPECT_EQ(fixture.heard.callsAfterFinished, 0);
    EXPECT_EQ(::waitpid(-1, nullptr, WNOHANG), -1) << "a process is left";
}

JobOptions fewLines()
{
    JobOptions options;
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
        std::size_t failures = 1;  ///< sentences that say so
    };
    for (const Case& c :
         {Case{soundRun, 0, "sound", "all is said", 0},
          Case{"say Pass 1: Checking inodes, blocks, and sizes\n", contract::kPLErrorInconclusive,
               "inconclusive", "it never came to the end"},
          Case{"", contract::kPLErrorInconclusive, "inconclusive", "it said nothing"},
          Case{soundRun + "exit 16", contract::kPLErrorToolFailed, "failed", "usage"},
          Case{soundRun + "kill 9", contract::kPLErrorToolFailed, "failed", "killed"},
          Case{soundRun + "shrink 4194304", contract::kPLErrorDiskChanged, "failed",
               "the file shrank below it"},
          Case{"flood-lines", contract::kPLErrorDamaged, "damaged", "problems without end"},
          Case{"flood-bytes", contract::kPLErrorToolMisbehaved, "failed", "noise without end",
               2}}) {
        FakeToolFixture fixture(c.script, fewLines());
        // The claim is read-only, so the tool needs write access of its own to cut the file.
        EXPECT_EQ(fixture.library.verify(fixture.disk), contract::kPLNoError) << c.because;
        EXPECT_EQ(fixture.heard.error, c.error) << c.because;
        EXPECT_EQ(fixture.heard.verdict, c.verdict) << c.because;
        EXPECT_FALSE(fixture.heard.message.empty()) << c.because;
        EXPECT_EQ(fixture.heard.textsOf(contract::kFsckFail).size(), c.failures) << c.because;
        expectOneEnd(fixture);
    }
}

TEST(Job, ARepairIsEndedWhereTheDiskCannotBeRead)
{
    FakeToolFixture fixture(
        "say Free blocks count wrong (1, counted=2).  Fix? no\n"
        "say-in-repair Error reading block 5 (Input/output error).  Ignore error? yes\n"
        "await-in-repair never\nexit 4");
    ASSERT_EQ(fixture.library.repair(fixture.disk), 0);
    EXPECT_EQ(fixture.heard.error, contract::kPLErrorUnreadable) << fixture.heard.message;
    EXPECT_EQ(fixture.heard.verdict, "failed");
    expectOneEnd(fixture);
}

TEST(Job, CancelIsHeardAndReported)
{
    FakeToolFixture fixture("ignore 2\nignore 15\nsay e2fsck 1.47.0\nwait");
    const auto press = [&fixture] {
        fixture.library.tool->cancelCurrentOperation();
    };
    fixture.heard.onMessage = [&] {
        for (int i = 0; fixture.heard.hasPlainLine("e2fsck 1.47.0") && i < 3; ++i)
            press();
    };
    ASSERT_EQ(fixture.library.verify(fixture.disk), 0);
    EXPECT_EQ(fixture.heard.error, contract::kPLErrorCancelled);
    EXPECT_EQ(fixture.heard.verdict, "stopped");
    press();  // nothing runs
    expectOneEnd(fixture);
}

TEST(Job, DestroyingTheToolEndsEverything)
{
    for (const std::string_view script : {"wait", "flood-lines", "ignore 2\nignore 15\nwait"}) {
        FakeToolFixture fixture(script);
        ASSERT_EQ(fixture.library.tool->beginStoragesystemFilesystemVerifyForDisk(fixture.disk), 0);
        while (fixture.library.loop.waiting() == 0)
            std::this_thread::yield();
        fixture.library.tool.reset();
        fixture.library.loop.drain();
        EXPECT_EQ(fixture.heard.started + fixture.heard.finished, 0) << script;
        EXPECT_EQ(::waitpid(-1, nullptr, WNOHANG), -1) << script;
        EXPECT_EQ(errno, ECHILD) << script;
    }
}

TEST(Job, MayBeDestroyedByTheOneWhoHearsIt)
{
    FakeToolFixture fixture("wait");
    fixture.heard.onMessage = [&fixture] {
        fixture.library.tool.reset();
    };
    ASSERT_EQ(fixture.library.tool->beginStoragesystemFilesystemVerifyForDisk(fixture.disk), 0);
    ASSERT_TRUE(fixture.library.loop.runUntil([&fixture] { return !fixture.library.tool; }));
    fixture.library.loop.drain();
    EXPECT_EQ(fixture.heard.finished, 0);
}

TEST(Job, TheNextMayBeginInTheFinishedOfTheLast)
{
    FakeToolFixture fixture(soundRun);
    contract::ErrorCode second = -1;
    fixture.heard.onFinished = [&] {
        if (fixture.heard.finished == 1)
            second = fixture.library.tool->beginStoragesystemFilesystemRepairForDisk(fixture.disk);
    };
    ASSERT_EQ(fixture.library.tool->beginStoragesystemFilesystemVerifyForDisk(fixture.disk), 0);
    EXPECT_EQ(fixture.library.tool->beginStoragesystemFilesystemVerifyForDisk(fixture.disk),
              contract::kPLErrorBusy);
    ASSERT_TRUE(fixture.library.loop.runUntil([&] { return fixture.heard.finished == 2; }));
    EXPECT_EQ(second, contract::kPLNoError);
    EXPECT_EQ(fixture.heard.verdict, "sound");
}

TEST(Job, RefusesBeforeItStarts)
{
    FakeToolFixture fixture(soundRun);
    const auto begin = [&fixture](const contract::DiskReference& disk) {
        return fixture.library.tool->beginStoragesystemFilesystemVerifyForDisk(
            std::make_shared<contract::DiskReference>(disk));
    };
    contract::DiskReference disk = *fixture.disk;
    disk.isWhole = true;
    EXPECT_EQ(begin(disk), contract::kPLErrorUnsupported);
    disk = *fixture.disk;
    disk.path.clear();
    EXPECT_EQ(begin(disk), contract::kPLErrorNoDiskReference);
    EXPECT_EQ(fixture.library.tool->beginStoragesystemFilesystemVerifyForDisk(nullptr),
              contract::kPLErrorNoDiskReference);
    fixture.library.loop.drain();
    EXPECT_EQ(fixture.heard.started, 0) << "a refused begin calls nobody back";
}

// The log is the place where a reason can be read.
TEST(Job, SaysWhyThereIsNoWay)
{
    FakeToolFixture fixture(soundRun);
    std::filesystem::remove(fixture.directory.path("tools/e2fsck"));
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
        contract::DiskReference disk = *fixture.disk;
        disk.filesystem = c.filesystem;
        ASSERT_EQ(fixture.library.repair(std::make_shared<contract::DiskReference>(disk)), 0);
        EXPECT_EQ(fixture.heard.error, c.error) << c.filesystem;
        EXPECT_NE(fixture.heard.message.find(c.says), std::string::npos) << fixture.heard.message;
        EXPECT_FALSE(fixture.library.manager.canRepair(c.filesystem));
        EXPECT_NE(
            fixture.library.manager.reasonAgainst(c.filesystem, Operation::Repair).find(c.says),
            std::string::npos);
    }
}

/// A FAT16 volume that a fake fsck.fat treats: what it says depends on whether it may write.
struct FakeFatFixture {
    explicit FakeFatFixture(std::string_view script)
    {
        directory.write("disk", {});
        std::filesystem::resize_file(directory.path("disk"), 20U << 20U);
        directory.write("disk", fatBootSector());
        std::filesystem::resize_file(directory.path("disk"), 20U << 20U);
        options.toolPath = directory.fakeTools(script, "fsck.fat");
    }

    static std::string fatBootSector()
    {
        std::string sector(512, '\0');
        sector.replace(0, 24,
                       std::string("\xEB\x3C\x90mkfs.fat\0\2\4\4\0\2\0\2\0\xA0\xF8\x28\0", 24));
        return sector.replace(510, 2, "\x55\xAA");
    }

    test::TestDirectory directory;
    JobOptions options;
};

const std::string fatDamage =
    "say FATs differ but appear to be intact.\n"
    "say /proc/self/fd/3: 2 files, 1/10211 clusters\n";

TEST(Job, IsToldThatAWritingToolComesToItsEndBeforeItStops)
{
    FakeFatFixture fixture(fatDamage + "await-in-repair pressed\nsay the end\nexit 1");
    test::JobFixture library(fixture.options);
    bool isPressed = false;
    library.listener.onMessage = [&] {
        // The look has shown it as a problem; the repair tells it as a plain line.
        if (!library.listener.hasPlainLine("FATs differ") || std::exchange(isPressed, true))
            return;
        library.tool->cancelCurrentOperation();
        fixture.directory.write("tools/pressed", "");
    };
    ASSERT_EQ(library.repair(test::reference(fixture.directory.path("disk"), "vfat")), 0);
    EXPECT_EQ(library.listener.verdict, "stopped");
    EXPECT_EQ(std::count(library.listener.plainLines.begin(), library.listener.plainLines.end(),
                         "the end\n"),
              2)
        << "of the look, and of the repair";
    EXPECT_EQ(
        std::count_if(
            library.listener.dictionaries.begin(), library.listener.dictionaries.end(),
            [](const contract::Dictionary& message) {
                return message.string(contract::kFsckMessageString).find("fsck.fat is writing") !=
                       std::string::npos;
            }),
        1);
}

TEST(Job, ProblemsThatTheLookHasShownAreNotShownAgain)
{
    FakeFatFixture fixture(fatDamage + "exit 1");
    test::JobFixture library(fixture.options);
    ASSERT_EQ(library.repair(test::reference(fixture.directory.path("disk"), "vfat")), 0);
    EXPECT_EQ(library.listener.verdict, "damaged") << "it never says that it has changed anything";
    EXPECT_EQ(library.listener.textsOf(contract::kFsckError).size(), 2U)
        << "once before the repair, and once for what is left";
    EXPECT_EQ(library.listener.textsOf(contract::kFsckRepair).size(), 1U) << "one pass is enough";
}

/// Of those who have the right; it ends the job at once.
class EmptyScript final : public Script {
public:
    explicit EmptyScript(EventQueue& events) : events_(events) {}
    void run() override
    {
        events_.add(Started{});
        events_.add(Finished{});
        events_.flush();
    }

private:
    EventQueue& events_;
};

TEST(PartOfImage, OthersAreAskedOnlyWhereTheToolNeedsADevice)
{
    const test::TestDirectory directory;
    directory.write("image", std::string(1 << 20, 'x'));
    const std::string tools = directory.fakeTools("exit 0");
    for (const char* tool : {"fsck.fat", "btrfs"})
        static_cast<void>(directory.fakeTools("exit 0", tool));
    struct Case {
        std::string filesystem;
        Operation operation;
        bool isAsked;
        std::string_view because;
    };
    for (const Case& c : {
             Case{"vfat", Operation::Verify, true, "fsck.fat knows no offsets"},
             Case{"vfat", Operation::Repair, true, "nor does it when it repairs"},
             Case{"ext4", Operation::Repair, false, "e2fsck finds it in the file"},
             Case{"btrfs", Operation::Verify, true, "a check of it is possible"},
             Case{"btrfs", Operation::Repair, false, "but no repair, whoever does it"},
             Case{"f2fs", Operation::Verify, false, "its tool is not installed"},
             Case{"swap", Operation::Verify, false, "nothing checks it"},
             Case{"", Operation::Verify, false, "nothing recognises it"},
         }) {
        JobOptions options;
        options.toolPath = tools;
        std::optional<PrivilegedJob> asked;
        options.privileged = [&asked](const PrivilegedJob& job, StopSwitch&, EventQueue& events) {
            asked = job;
            return std::make_unique<EmptyScript>(events);
        };
        auto part = *test::reference(directory.path("image"), c.filesystem);
        part.offset = 4096;
        part.length = 1 << 16;
        const auto disk = std::make_shared<const contract::DiskReference>(part);
        auto claim = DiskClaim::take(*disk, Access::ReadWrite, {});
        auto request = std::make_shared<VolumeRequest>(
            VolumeRequest{disk, c.operation, *std::move(claim), {}, toolFor(c.filesystem)});
        test::TestLoop loop;
        const test::EnglishTexts texts;
        test::Listener listener;
        const Job job(
            [&](StopSwitch& stop, EventQueue& events) {
                return std::make_unique<PartOfImageScript>(
                    std::move(*request), JobContext{*disk, options, texts, stop, events});
            },
            EventReceiver{&listener,
                          disk,
                          {},
                          [] {
                          }},
            loop);
        ASSERT_TRUE(loop.runUntil([&] { return listener.finished == 1; })) << c.because;
        EXPECT_EQ(listener.started, 1) << c.because;
        ASSERT_EQ(asked.has_value(), c.isAsked) << c.because;
        if (!asked)
            continue;
        ASSERT_TRUE(asked->image);
        EXPECT_EQ(asked->image->offset(), 4096U);
        EXPECT_EQ(asked->task.operation, c.operation);
    }
}

}  // namespace
