// SPDX-License-Identifier: Apache-2.0
#include "contract/pellar/ErrorCodes.h"
#include "pellar/jobs/PartOfImageScript.h"
#include "pellar/tools/ToolTable.h"
#include "tests/pellar/JobFixture.h"

#include <fcntl.h>
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

TEST(Job, VerifyAnswersWhatIsTrue)
{
    struct Case {
        std::string script;
        contract::ErrorCode error;
        std::string_view verdict;
        std::size_t failures = 1;  ///< sentences that say so
    };
    for (const Case& c :
         {Case{soundRun, 0, "sound", 0},
          Case{"say Pass 1: Checking inodes\n", contract::kPLErrorInconclusive, "inconclusive"},
          Case{soundRun + "kill 9", contract::kPLErrorToolFailed, "failed"},
          Case{soundRun + "shrink 4194304", contract::kPLErrorDiskChanged, "failed"},
          // Ten of its lines are shown as problems, and the number of the others.
          Case{"flood-lines", contract::kPLErrorDamaged, "damaged", 12},
          Case{"flood-bytes", contract::kPLErrorToolMisbehaved, "failed", 2}}) {
        FakeToolFixture fixture(c.script,
                                test::with(&JobOptions::outputLimits, {1000, 10U << 20U}));
        // The claim is read-only, so the tool needs write access of its own to cut the file.
        EXPECT_EQ(fixture.library.verify(fixture.disk), contract::kPLNoError) << c.script;
        EXPECT_EQ(fixture.heard.error, c.error) << c.script;
        EXPECT_EQ(fixture.heard.verdict, c.verdict) << c.script;
        EXPECT_FALSE(fixture.heard.message.empty()) << c.script;
        EXPECT_EQ(fixture.heard.textsOf(contract::kFsckFail).size() +
                      fixture.heard.textsOf(contract::kFsckProblem).size(),
                  c.failures)
            << c.script;
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

// Nothing here replays that journal, so nothing is written over it.
TEST(Job, AHibernatedVolumeIsLeftToItsOwnSystem)
{
    const test::TestDirectory directory;
    const auto image = directory.makeVolume("disk", "ntfs");
    if (image.empty())
        GTEST_SKIP() << "mkntfs is not installed (package ntfs-3g)";
    const std::string script = "say The NTFS partition is hibernated.\nexit 0";
    static_cast<void>(directory.fakeTools(script, "ntfsfix"));
    test::JobFixture library(
        test::with(&JobOptions::toolPath, directory.fakeTools(script, "ntfsresize")));
    ASSERT_EQ(library.repair(test::reference(image, "ntfs")), 0);
    EXPECT_EQ(library.listener.verdict, "inconclusive") << library.listener.message;
    EXPECT_TRUE(std::ranges::none_of(library.traces, [](const std::string& line) {
        return line.starts_with("run: ") && test::contains(line, "ntfsfix");
    }));
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
    for (const auto& [filesystem, error, says] :
         {std::tuple("%@fs", contract::kPLErrorUnsupported, "no tool for the file system “%@fs”"),
          {"swap", contract::kPLErrorUnsupported, "it is swap space"},
          {"ext4", contract::kPLErrorToolMissing, "e2fsck is not installed (package e2fsprogs)"}}) {
        ASSERT_EQ(fixture.library.repair(test::reference(fixture.disk->path, filesystem)), 0);
        EXPECT_EQ(fixture.heard.error, error) << filesystem;
        EXPECT_TRUE(test::contains(fixture.heard.message, says)) << fixture.heard.message;
        const Manager& manager = fixture.library.manager;
        EXPECT_FALSE(manager.canRepair(filesystem));
        EXPECT_TRUE(test::contains(manager.reasonAgainst(filesystem, Operation::Repair), says));
    }
}

/// A FAT16 volume that a fake fsck.fat treats: what it says depends on whether it may write.
struct FakeFatFixture {
    explicit FakeFatFixture(std::string_view script)
        : library(test::with(&JobOptions::toolPath, directory.fakeTools(script, "fsck.fat")))
    {
        std::string volume(20U << 20U, '\0');
        volume.replace(0, 24, {"\xEB\x3C\x90mkfs.fat\0\2\4\4\0\2\0\2\0\xA0\xF8\x28\0", 24});
        directory.write("disk", volume.replace(510, 2, "\x55\xAA"));
    }
    void repair() { EXPECT_EQ(library.repair(test::reference(directory.path("disk"), "vfat")), 0); }

    test::TestDirectory directory;
    test::JobFixture library;
};

const std::string fatDamage =
    "say FATs differ but appear to be intact.\n"
    "say /proc/self/fd/3: 2 files, 1/10211 clusters\n";

TEST(Job, IsToldThatAWritingToolComesToItsEndBeforeItStops)
{
    FakeFatFixture fixture(fatDamage + "await-in-repair pressed\nsay the end\nexit 1");
    const test::Listener& heard = fixture.library.listener;
    bool isPressed = false;
    fixture.library.listener.onMessage = [&] {
        // The look has shown it as a problem; the repair tells it as a plain line.
        if (!heard.hasPlainLine("FATs differ") || std::exchange(isPressed, true))
            return;
        fixture.library.tool->cancelCurrentOperation();
        fixture.directory.write("tools/pressed", "");
    };
    fixture.repair();
    EXPECT_EQ(heard.verdict, "stopped");
    EXPECT_EQ(std::ranges::count(heard.plainLines, "the end\n"), 2) << "of look and repair";
    EXPECT_EQ(std::ranges::count_if(heard.dictionaries,
                                    [](const contract::Dictionary& message) {
                                        return test::contains(
                                            message.string(contract::kFsckMessageString),
                                            "fsck.fat is writing");
                                    }),
              1);
}

TEST(Job, ProblemsThatTheLookHasShownAreNotShownAgain)
{
    FakeFatFixture fixture("say fsck.fat 4.2 (2021-01-31)\n" + fatDamage + "exit 1");
    fixture.repair();
    const test::Listener& heard = fixture.library.listener;
    EXPECT_EQ(heard.verdict, "damaged") << "it never says that it has changed anything";
    EXPECT_TRUE(heard.hasPlainLine("The volume “Disk” could not be repaired."));
    EXPECT_EQ(heard.textsOf(contract::kFsckProblem).size(), 2U)
        << "once before the repair, and once for what is left";
    EXPECT_EQ(heard.result.string(contract::kPLTool), "fsck.fat 4.2");
    EXPECT_EQ(heard.result.integer(contract::kPLProblems), 1);
    EXPECT_EQ(heard.textsOf(contract::kFsckRepair).size(), 1U) << "one pass is enough";
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
    for (const auto& [filesystem, operation, isAsked] :
         {std::tuple("vfat", Operation::Verify, true),  // fsck.fat knows no offsets
          {"vfat", Operation::Repair, true},
          {"ext4", Operation::Repair, false},  // e2fsck finds it in the file
          {"btrfs", Operation::Verify, true},
          {"btrfs", Operation::Repair, false},  // nobody repairs it
          {"f2fs", Operation::Verify, false},   // its tool is not installed
          {"swap", Operation::Verify, false},
          {"", Operation::Verify, false}}) {
        JobOptions options = test::with(&JobOptions::toolPath, tools);
        std::optional<PrivilegedJob> asked;
        options.privileged = [&asked](const PrivilegedJob& job, StopSwitch&, EventQueue& events) {
            asked = job;
            return std::make_unique<EmptyScript>(events);
        };
        auto part = *test::reference(directory.path("image"), filesystem);
        part.offset = 4096;
        part.length = 1 << 16;
        const auto disk = std::make_shared<const contract::DiskReference>(part);
        auto claim = DiskClaim::take(*disk, Access::ReadWrite, {});
        VolumeRequest request{disk, operation, *std::move(claim), {}, toolFor(filesystem)};
        test::TestLoop loop;
        const test::EnglishTexts texts;
        test::Listener listener;
        StopSwitch stop;
        EventQueue events(loop, {&listener, disk, {}, [] {
                                 }});
        PartOfImageScript(std::move(request), {*disk, options, texts, stop, events}).run();
        loop.drain();
        EXPECT_EQ(listener.started + listener.finished, 2) << filesystem;
        ASSERT_EQ(asked.has_value(), isAsked) << filesystem;
        if (!asked)
            continue;
        ASSERT_TRUE(asked->image);
        EXPECT_EQ(asked->image->offset(), 4096U);
        EXPECT_EQ(asked->task.operation, operation);
    }
}

// The record lies where only root reads, though this user could open the disk by now.
TEST(UndoOfADevice, TheAdministratorIsAskedWhereItsStoreHasTheNewestRepair)
{
    using std::chrono::seconds;
    const auto repairAt = [](seconds time) {
        return RecordedRepair{{"/dev/full", 0, 4096, "1234", "ext4", ""},
                              {Subject::Filesystem, Operation::Repair},
                              ::geteuid(),
                              std::chrono::system_clock::time_point(time)};
    };
    for (const auto& [theirs, ours, isAsked] : {std::tuple(seconds(0), seconds(0), false),
                                                {seconds(9), seconds(0), true},
                                                {seconds(9), seconds(5), true},
                                                {seconds(5), seconds(9), false}}) {
        const test::TestDirectory directory;
        JobOptions options = test::tryingIn(directory.path("own"));
        Trials system;
        system.room.directory = options.trials.systemDirectory = directory.path("system");
        system.isPublic = true;
        std::string bytes(4096, 'x');
        directory.write("bytes", bytes);
        const FileDescriptor file(::open(directory.path("bytes").c_str(), O_RDWR | O_CLOEXEC));
        FileRegion disk(file.get(), 0, bytes.size());
        for (const auto& [trials, time] : {std::pair(system, theirs), {options.trials, ours}})
            if (time != seconds(0)) {
                const auto store = openRecords(trials);
                EXPECT_TRUE(store->save(repairAt(time), {{0, 512}}, disk, disk)->apply(disk));
            }
        bool wasAsked = false;
        options.privileged = [&](const PrivilegedJob&, StopSwitch&, EventQueue& events) {
            wasAsked = true;
            return std::make_unique<EmptyScript>(events);
        };
        contract::DiskReference device;
        device.path = "/dev/full";
        device.length = 4096;
        test::JobFixture library(options);
        static_cast<void>(library.run({Subject::Filesystem, Operation::Undo},
                                      std::make_shared<const contract::DiskReference>(device)));
        EXPECT_EQ(wasAsked, isAsked) << theirs.count() << ours.count();
    }
}

}  // namespace
