// SPDX-License-Identifier: Apache-2.0
// Repairs that are tried, taken back and finished.

#include "orvane/jobs/RepairRecords.h"
#include "pellar/undo/PublicIndex.h"
#include "tests/support/InterruptedRepair.h"
#include "tests/support/LoopDevice.h"
#include "tests/terminal/ProgramTest.h"

namespace orvane::test {
namespace {

class UndoTest : public ProgramTest {
protected:
    /// The records of the repairs that can be undone, as the disk's history tells them.
    std::vector<std::string> undoable(const std::string& image) const
    {
        std::vector<std::string> verdicts;
        for (const auto& one : Events(run({"history", "--json", image}).output).named("run"))
            if (one["record"].is_string())
                verdicts.push_back(one["verdict"]);
        return verdicts;
    }
    bool isInterrupted(const std::string& image) const
    {
        const bool isSaid =
            run({"list", image}).output.find("repair interrupted: finish or undo") !=
            std::string::npos;
        const auto disk = Events(run({"list", "--json", image}).output).named("disk").front();
        EXPECT_EQ(disk["interruptedRepair"].is_string(), isSaid);
        return isSaid;
    }
};

TEST_F(UndoTest, APreviewSaysWhatARepairWouldDoAndWritesNothing)
{
    const auto image = makeDamagedVolume("a");
    const std::string before = contentsOf(image);
    const RunResult preview = run({"repair", "--preview", "--keep", "kept", "a"});
    EXPECT_EQ(preview.status, 4);
    EXPECT_NE(preview.output.find("would make it sound; nothing was written"), std::string::npos)
        << preview.output;
    EXPECT_TRUE(contentsOf(image) == before);
    EXPECT_EQ(runTool({"e2fsck", "-fn", path("kept")}).status, 0) << "the repaired volume";
    EXPECT_TRUE(undoable("a").empty());

    const std::string kept = contentsOf(path("kept"));
    const RunResult again = run({"repair", "--preview", "--keep", "kept", "a"});
    EXPECT_EQ(again.status, 8);
    EXPECT_NE(again.errors.find("is there already"), std::string::npos) << again.errors;
    EXPECT_TRUE(contentsOf(path("kept")) == kept);
    EXPECT_EQ(again.output, "") << "refused before anything begins";
}

TEST_F(UndoTest, AnUndoneRepairLeavesEveryByteAsItWas)
{
    const auto image = makeDamagedVolume("it's a");
    const std::string before = contentsOf(image);
    const RunResult repaired = run({"repair", "it's a"});
    EXPECT_EQ(repaired.status, 1);
    EXPECT_NE(repaired.output.find("To take the repair back: fixwell undo 'it'\\''s a'\n"),
              std::string::npos)
        << repaired.output;
    EXPECT_FALSE(contentsOf(image) == before);
    EXPECT_EQ(undoable("it's a"), std::vector<std::string>{"repaired"});

    const RunResult undone = run({"undo", "--json", "it's a"});
    EXPECT_EQ(undone.status, 0) << undone.output;
    EXPECT_EQ(Events(undone.output).story({"started", "finished"}),
              (std::vector<std::string>{"started it's a", "finished it's a undone"}));
    EXPECT_TRUE(contentsOf(image) == before);
    EXPECT_TRUE(undoable("it's a").empty());
    EXPECT_EQ(Events(run({"list", "--json", "it's a"}).output).named("disk").front()["verdict"],
              "undone")
        << "it is no longer repaired";

    EXPECT_EQ(run({"undo", "it's a"}).status, 8);
    EXPECT_EQ(run({"undo", "none"}).status, 8);
}

TEST_F(UndoTest, ARepairThatLeavesDamageIsAppliedOnDemandOnly)
{
    const auto image = makeVolume("a");
    useTool("write-in-repair changed\nexit 4");
    const std::string before = contentsOf(image);
    const RunResult repaired = run({"repair", "a"});
    EXPECT_EQ(repaired.status, 4) << repaired.output;
    EXPECT_NE(repaired.output.find("fixwell repair --apply-unproven a\n"), std::string::npos)
        << repaired.output;
    EXPECT_TRUE(contentsOf(image) == before);

    EXPECT_EQ(run({"repair", "--apply-unproven", "a"}).status, 4);
    EXPECT_TRUE(contentsOf(image).starts_with("changed"));
    EXPECT_EQ(undoable("a"), std::vector<std::string>{"damaged"});
    EXPECT_EQ(run({"undo", "a"}).status, 0);
    EXPECT_TRUE(contentsOf(image) == before);

    static_cast<void>(run({"repair", "--apply-unproven", "--no-undo", "a"}));
    EXPECT_TRUE(undoable("a").empty());
    EXPECT_TRUE(contentsOf(image).starts_with("changed"));
}

TEST_F(UndoTest, AnInterruptedRepairIsPointedOutAndFinishedOrUndone)
{
    const auto image = makeVolume("a");
    const std::string before = contentsOf(image);
    for (const std::string command : {"finish", "undo"}) {
        write(image, before);
        const std::string repaired = interruptRepair(image, path("state/orvane/repairs/records"));
        EXPECT_TRUE(isInterrupted("a"));
        const std::string half = contentsOf(image);
        EXPECT_EQ(run({"repair", "a"}).status, 8);
        EXPECT_TRUE(contentsOf(image) == half) << "nothing is built on it";
        EXPECT_EQ(run({command, "a"}).status, 0);
        EXPECT_TRUE(contentsOf(image) == (command == "undo" ? before : repaired));
        EXPECT_FALSE(isInterrupted("a"));
    }
}

TEST_F(UndoTest, ADeviceIsTreatedAsAnImageIs)
{
    if (const char* const obstacle = LoopDevice::obstacle())
        GTEST_SKIP() << obstacle;
    const auto image = makeDamagedVolume("a");
    const std::string before = contentsOf(image);
    const LoopDevice device(image.native());
    EXPECT_EQ(run({"repair", "--preview", device.name()}).status, 4);
    EXPECT_EQ(run({"repair", device.name()}).status, 1);
    EXPECT_EQ(undoable(device.name()), std::vector<std::string>{"repaired"});
    EXPECT_EQ(run({"undo", device.name()}).status, 0);
    EXPECT_TRUE(contentsOf(device.name()) == before);
}

TEST_F(UndoTest, OfSeveralVolumesEachIsRepairedAndTheOneThatIsNamedUndone)
{
    makeDisk("disk.img", {makeDamagedVolume("first"), makeDamagedVolume("second")});
    const std::string before = contentsOf(path("disk.img"));
    const RunResult repaired = run({"repair", "--json", "disk.img"});
    EXPECT_EQ(repaired.status, 1) << repaired.output << repaired.errors;
    const std::vector<std::string> story{"started disk.img#1", "finished disk.img#1 repaired",
                                         "started disk.img#2", "finished disk.img#2 repaired"};
    EXPECT_EQ(Events(repaired.output).story({"started", "finished"}), story);
    EXPECT_EQ(run({"verify", "disk.img"}).status, 0);
    const RunResult unclear = run({"undo", "disk.img"});
    EXPECT_EQ(unclear.status, 8);
    EXPECT_NE(unclear.errors.find("name one: disk.img#1, disk.img#2"), std::string::npos)
        << unclear.errors;
    EXPECT_EQ(run({"undo", "disk.img#3"}).status, 8);
    EXPECT_EQ(run({"undo", "disk.img#2"}).status, 0);
    EXPECT_TRUE(contentsOf(path("disk.img")).substr(9 * mebibyte) == before.substr(9 * mebibyte));
    EXPECT_FALSE(contentsOf(path("disk.img")) == before);
    EXPECT_EQ(run({"undo", "disk.img"}).status, 0) << "one is left";
    EXPECT_TRUE(contentsOf(path("disk.img")) == before);
}

TEST_F(UndoTest, ARepairedMapIsUndone)
{
    const auto disk = makeDisk("disk.img", {makeVolume("volume")});
    patch(disk, 512, std::string(512, '\0'));
    const std::string before = contentsOf(disk);
    ASSERT_EQ(run({"repair", "--preview", "--partition-map", "disk.img"}).status, 4);
    EXPECT_TRUE(contentsOf(disk) == before);
    const RunResult repaired = run({"repair", "--partition-map", "disk.img"});
    ASSERT_EQ(repaired.status, 1);
    EXPECT_NE(repaired.output.find("fixwell undo --partition-map disk.img"), std::string::npos)
        << repaired.output;
    EXPECT_EQ(run({"undo", "disk.img"}).status, 8) << "of its volume nothing is kept";
    EXPECT_EQ(run({"undo", "--partition-map", "disk.img"}).status, 0);
    EXPECT_TRUE(contentsOf(disk) == before);
}

/// A place where the administrator keeps repairs of /dev/full, and a user of it.
class SystemRecords : public testing::Test {
protected:
    void put(const std::string& id, uid_t user, std::chrono::seconds time,
             pellar::Subject subject = pellar::Subject::Filesystem,
             pellar::RecordState state = pellar::RecordState::Applied) const
    {
        const bool isOfPermissions = subject == pellar::Subject::Permissions;
        const auto place =
            isOfPermissions ? pellar::permissionIndexIn(system_) : pellar::recordIndexIn(system_);
        const auto records = std::make_shared<const pellar::StoreDirectory>(
            *pellar::StoreDirectory::open(system_ / "records", ::fsync));
        pellar::RecordFacts facts;
        facts.repair = {{"/dev/full", 0, 4096, "1234", "ext4", ""},
                        {subject, pellar::Operation::Repair},
                        user,
                        std::chrono::system_clock::time_point(time)};
        facts.state = state;
        EXPECT_TRUE(pellar::PublicIndex::open(place, records, ::fsync)->publish(id, facts));
    }
    RepairRecords seenBy(uid_t user) const
    {
        pellar::Trials trials;
        trials.room.directory = own_;
        trials.systemDirectory = system_;
        trials.user = user;
        return RepairRecords(trials);
    }
    static DiskFacts disk(const char* uuid = "1234")
    {
        DiskFacts facts;
        facts.path = "/dev/full";
        facts.length = 4096;
        facts.uuid = uuid;
        return facts;
    }

    TestDirectory directory_;
    const std::filesystem::path system_ = directory_ / "system";
    const std::filesystem::path own_ = directory_ / "own";
};

TEST_F(SystemRecords, AreKnownToEverybodyAndBelongToWhoAsked)
{
    using std::chrono::seconds;
    EXPECT_EQ(seenBy(1000).newestOf(disk()), nullptr);
    EXPECT_TRUE(seenBy(1000).knowsAll()) << "nothing was ever kept";
    put("old", 1000, seconds(100));
    put("half", 2000, seconds(200), pellar::Subject::Filesystem, pellar::RecordState::Applying);
    put("map", 1000, seconds(300), pellar::Subject::PartitionMap);
    put("modes", 1000, seconds(400), pellar::Subject::Permissions);
    for (const uid_t user : {1000U, 2000U}) {
        const RepairRecords records = seenBy(user);
        const auto* const newest = records.newestOf(disk());
        ASSERT_NE(newest, nullptr);
        EXPECT_EQ(newest->id, "half") << "whoever asked: an older one is of no use before";
        EXPECT_TRUE(newest->isInterrupted());
        EXPECT_EQ(records.isUsers(*newest), user == 2000);
        EXPECT_EQ(records.newestOf(disk("5678")), nullptr) << "another disk of that name";
        const auto* const permissions = records.newestOfPermissions(disk());
        ASSERT_NE(permissions, nullptr);
        EXPECT_EQ(permissions->id, "modes");
        EXPECT_EQ(records.isUsers(*permissions), user == 1000);
        EXPECT_EQ(records.newestOfPermissions(disk("5678")), nullptr);
        EXPECT_TRUE(records.knowsAll());
    }
    std::filesystem::permissions(pellar::recordIndexIn(system_), std::filesystem::perms::all);
    EXPECT_FALSE(seenBy(1000).knowsAll()) << "others could have written that";
    EXPECT_EQ(seenBy(1000).newestOf(disk()), nullptr);
}

TEST(RepairRecords, ARecordBelongsToTheRunThatWrote)
{
    using std::chrono::milliseconds;
    const orvane::Run::Time time{std::chrono::seconds(1000)};
    const pellar::RecordedRepair repair{
        {}, {pellar::Subject::Filesystem, pellar::Operation::Repair}, 0, time};
    const auto run = [time](const char* action, int begins, int ends, const char* verdict) {
        const std::optional<RunEnd> end =
            *verdict != '\0' ? std::optional(RunEnd{verdict, 0, ""}) : std::nullopt;
        return orvane::Run{action, time + milliseconds(begins),
                           end ? std::optional(time + milliseconds(ends)) : std::nullopt, end};
    };
    struct Case {
        std::vector<orvane::Run> runs;
        int written;  ///< -1: none of them
        std::string_view because;
    };
    for (const Case& c :
         {Case{{run("repair", -5000, 5000, "repaired")}, 0, "the time lies in it"},
          Case{{run("repair", 700, 5000, "repaired")}, 0, "times of records are whole seconds"},
          Case{{run("verify", -5000, 5000, "sound")}, -1, "writes nothing"},
          Case{{run("repair", -9000, -5000, "repaired")}, -1, "over before"},
          Case{{run("repair", 1000, 5000, "repaired")}, -1, "begun after"},
          Case{{run("repair", -5000, 0, "")}, 0, "cut off"},
          Case{{run("repair", -5000, 0, ""), run("repair", 800, 900, "failed")}, 0, "refused"},
          Case{{run("repair", 100, 200, "damaged"), run("repair", 300, 400, "repaired")},
               1,
               "after a preview"},
          Case{{run("repair", 100, 200, "repaired"), run("repair", 300, 400, "sound")},
               0,
               "before another look"}}) {
        const orvane::Run* const found = runOf(repair, c.runs);
        EXPECT_EQ(found == nullptr ? -1 : found - c.runs.data(), c.written) << c.because;
    }
}

}  // namespace
}  // namespace orvane::test
