// SPDX-License-Identifier: Apache-2.0
#include "contract/foundation/StyledText.h"
#include "contract/pellar/MessageKeys.h"
#include "orvane/support/disks/Disk.h"
#include "orvane/support/history/Database.h"
#include "orvane/support/history/DiskHistories.h"
#include "orvane/support/history/HistoryStore.h"
#include "orvane/support/settings/ValueJSON.h"
#include "tests/support/TestDirectory.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <chrono>
#include <cmath>
#include <thread>
#include <utility>

namespace orvane {
namespace {

using contract::Array;
using contract::Dictionary;
using contract::Name;
using contract::StyledText;
using contract::Value;
namespace fs = std::filesystem;

const contract::TextStyle red{contract::Font::boldSystem(11), contract::Color{1, 0, 0.25, 1}, {}};

Dictionary line(int number)
{
    return Dictionary::of({{Name("kOV_typeOfOutputKey"), Name("kOV_typeOfOutput_string")},
                           {contract::kFsckVerbosity, 2},
                           {Name("kOV_finalAttributedString_type"),
                            StyledText::make("line " + std::to_string(number) + "\n", red)}});
}

Array lines(int first, int end)
{
    const Array list = Array::make();
    for (int i = first; i < end; ++i)
        list.append(line(i));
    return list;
}

Dictionary summary()
{
    return Dictionary::of({{contract::kFsckVerbosity, -2}, {contract::kFsckError, 3}});
}

/// A record as exact text: kinds, order, styles and bytes.
std::string exactly(const Value& value)
{
    return jsonFromValue(value).dump();
}

Array loaded(HistoryStore& store, std::string_view volume)
{
    const Array history = Array::make();
    RecordTimes times;
    store.load(store.recordsOf(volume), history, times);
    return history;
}

DiskFacts device(const std::string& identifier, const std::string& uuid = "")
{
    DiskFacts facts;
    facts.identifier = identifier;
    facts.uuid = uuid;
    return facts;
}

class HistoryTest : public testing::Test {
protected:
    HistoryStore open()
    {
        return {file_, limits_, [this](const std::string& text) {
                    warnings_.push_back(text);
                }};
    }

    const test::TestDirectory directory_;
    fs::path file_ = directory_ / "state/history.sqlite3";
    HistoryStore::Limits limits_ = {};
    std::vector<std::string> warnings_;
    const DiskFacts disk_ = device("/dev/x");
};

TEST_F(HistoryTest, RecordsComeBackAsTheyWere)
{
    const StyledText twoStyles = StyledText::make("a", red);
    twoStyles.append(StyledText::make("b\xff", {}));
    const std::string hostile("\0\x1b[31m\xc3\x28%s'\"", 13);
    const Array history = Array::of(
        {line(1),
         Dictionary::of({{contract::kFsckMessageType, contract::kFsckError},
                         {contract::kFsckMessageString, "Entry %1$@ is %2$@"},
                         {contract::kFsckParameters, Array::of({"x", 2, 2.0, true, hostile})},
                         {contract::kFsckVerbosity, -1},
                         {Name("kOV_typeOfOutputKey"), Name("kOV_typeOfOutput_dict")},
                         {Name("kOV_finalAttributedString_type"), twoStyles}}),
         // The same keys, but not of the kinds that they have in good order.
         Dictionary::of({{contract::kFsckVerbosity, 1.5},
                         {contract::kFsckMessageType, 7},
                         {Name("kOV_typeOfOutputKey"), "made up"},
                         {Name("kOV_finalAttributedString_type"), hostile}}),
         Dictionary::of({{Name("kOV_finalAttributedString_type"), StyledText::make("", red)},
                         {contract::kFsckMessageType, ""},
                         {Name(hostile), Dictionary::of({{Name("deep"), Array::make()}})},
                         {Name("infinite"), -INFINITY}}),
         Dictionary::make(), summary()});
    ASSERT_TRUE(open().append("v", history, 0));
    HistoryStore reopened = open();
    EXPECT_EQ(exactly(loaded(reopened, "v")), exactly(history));

    RecordTimes ofALongerList;
    ofALongerList.add(7, {});
    ofALongerList.add(9, RecordTimes::Time(std::chrono::seconds(1)));
    ASSERT_TRUE(reopened.append("shorter", lines(0, 3), 0, ofALongerList));
    EXPECT_EQ(loaded(reopened, "shorter").size(), 3U);
    struct stat status = {};
    ASSERT_EQ(::stat(file_.c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 0777U, 0600U);
}

TEST_F(HistoryTest, TwoProgramsAddToOneVolume)
{
    HistoryStore one = open();
    HistoryStore other = open();
    for (int i = 0; i < 60; i += 20) {
        ASSERT_TRUE(one.append("v", lines(i, i + 10), 0));
        ASSERT_TRUE(other.append("v", lines(i + 10, i + 20), 0));
    }
    EXPECT_EQ(exactly(loaded(one, "v")), exactly(lines(0, 60)));
    EXPECT_EQ(one.recordsOf("v").size(), 60);
}

TEST_F(HistoryTest, OlderRunsAreDroppedWhole)
{
    limits_ = {100};
    HistoryStore mine = open();
    // Saved in portions that do not end where the runs do.
    const Array all = Array::make();
    std::size_t saved = 0;
    for (int i = 0; i < 120; ++i) {
        all.append(i % 30 < 29 ? line(i % 30) : summary());
        ASSERT_TRUE(i % 7 != 6 || mine.append("v", all, std::exchange(saved, all.size())));
    }
    const Array kept = loaded(mine, "v");
    EXPECT_LE(kept.size(), 100U);
    EXPECT_GE(kept.size(), 60U);
    EXPECT_EQ(exactly(kept.front()), exactly(line(0))) << "starts with the start of a run";

    ASSERT_TRUE(mine.append("v", lines(0, 250), 0));
    EXPECT_LE(loaded(mine, "v").size(), 100U) << "more at once than a volume may have";
    EXPECT_EQ(exactly(loaded(mine, "v").back()), exactly(line(249))) << "the newest are kept";
}

// As many at once as a flood of output brings: nothing is dropped that must stay, and what must go
// has gone at the latest when the store is closed.
TEST_F(HistoryTest, AFullVolumeIsTrimmedLittleByLittle)
{
    limits_ = {20'000};
    const Array portion = lines(0, 2000);
    {
        HistoryStore mine = open();
        for (int i = 0; i < 40; ++i) {
            const auto before = mine.recordsOf("v");
            ASSERT_TRUE(mine.append("v", portion, 0));
            const auto after = mine.recordsOf("v");
            EXPECT_LE(after.size(), 25'000);
            EXPECT_LE(i == 0 ? 0 : after.next - before.next, 5000) << "dropped at once";
        }
    }
    EXPECT_LE(open().recordsOf("v").size(), 20'000);
}

TEST_F(HistoryTest, ADamagedDatabaseIsKeptAsideAndANewOneBegun)
{
    test::write(file_, "this is no database, but somebody's thesis");
    HistoryStore mine = open();
    ASSERT_EQ(warnings_.size(), 1U);
    EXPECT_TRUE(mine.isKept() && mine.append("v", lines(1, 2), 0));
    bool isAside = false;
    for (const auto& file : fs::directory_iterator(file_.parent_path()))
        isAside = isAside || test::contentsOf(file.path()).ends_with("thesis");
    EXPECT_TRUE(isAside) << "nothing is thrown away";
}

TEST_F(HistoryTest, DamageThatShowsOnlyLaterIsSetAsideAndEverythingSavedAgain)
{
    const DiskFacts damaged = device("/dev/y");
    {
        HistoryStore mine = open();
        ASSERT_TRUE(mine.append(DiskHistories(mine).keyOf(damaged), lines(0, 5000), 0));
    }
    HistoryStore mine = open();
    DiskHistories histories(mine);
    histories.historyOf(disk_).append(line(1));
    histories.saveNew();
    test::patch(file_, 20 * 4096, std::string(20 * 4096, '\x5A'));
    EXPECT_LT(histories.historyOf(damaged).size(), 5000U) << "what could still be read";
    EXPECT_EQ(warnings_.size(), 1U);
    histories.saveNew();
    EXPECT_EQ(loaded(mine, histories.keyOf(disk_)).size(), 1U) << "saved again in the new database";
}

TEST_F(HistoryTest, APageThatMakesNoSenseIsDamage)
{
    for (const char* const page : {"substr(page, 1, length(page) - 1)", "x'0101'",
                                   "x'ffffffffffffffffffffff'", "x'010000ffffffffffffffffff01'"}) {
        const auto file = file_;
        file_ = directory_ / ("state/" + std::to_string(warnings_.size()));
        ASSERT_TRUE(open().append("v", lines(0, 100), 0));
        ASSERT_TRUE(Database::open(file_).execute(
            ("UPDATE records SET page = " + std::string(page)).c_str()));
        HistoryStore mine = open();
        const std::size_t warnings = warnings_.size();
        EXPECT_LT(loaded(mine, "v").size(), 100U) << "what could still be read";
        EXPECT_EQ(warnings_.size(), warnings + 1) << page;
        EXPECT_TRUE(mine.append("v", lines(0, 2), 0) && loaded(mine, "v").size() == 2U) << page;
        file_ = file;
    }
}

TEST_F(HistoryTest, WhatCannotBeKeptHoldsInMemoryWithOneWarning)
{
    test::write(directory_ / "file", "");
    fs::create_directory(directory_ / "directory");
    fs::create_symlink(directory_ / "victim", directory_ / "link");
    for (const char* const name : {"file/history.sqlite3", "directory", "link"}) {
        file_ = directory_ / name;
        warnings_.clear();
        HistoryStore mine = open();
        EXPECT_FALSE(mine.isKept());
        EXPECT_TRUE(mine.append("v", lines(1, 2), 0));
        mine.endRun(mine.beginRun("v", "verify", {}), {"sound", 0, ""}, {});
        EXPECT_TRUE(mine.lastRun("v") && mine.lastRun("v")->end) << "runs are still known";
        EXPECT_EQ(warnings_.size(), 1U) << name;
    }
    EXPECT_FALSE(fs::exists(directory_ / "victim")) << "a link is not followed";
}

TEST_F(HistoryTest, RunsAreKeptAndCutOffOnesStayOpen)
{
    const Run::Time start(std::chrono::seconds(1000));
    const RunEnd end{"damaged", -69701, "cannot ‘\x1b’", "e2fsck 1.47.0", 62, 3};
    {
        HistoryStore mine = open();
        mine.endRun(mine.beginRun("v", "verify", start), end, start + std::chrono::seconds(5));
        mine.beginRun("v", "repair", start);
    }
    HistoryStore mine = open();
    const auto runs = mine.runs("v");
    ASSERT_EQ(runs.size(), 2U);
    EXPECT_EQ(runs[0].end, end);
    EXPECT_EQ(runs[0].finished, start + std::chrono::seconds(5));
    EXPECT_EQ(runs[1].verdict(), "running") << "this program is still there";
    EXPECT_EQ(mine.lastRun("v")->action, "repair");

    Database file = Database::open(file_);
    for (const char* const program : {"owner || '1'", "'other ' || owner", "''", "'a ../self 1'"}) {
        ASSERT_TRUE(file.execute(("UPDATE openRuns SET owner = " + std::string(program)).c_str()));
        EXPECT_EQ(mine.lastRun("v")->verdict(), "") << "cut off with its program: " << program;
    }
}

// As a program made it before runs had a tool.
TEST_F(HistoryTest, AnEarlierDatabaseGetsTheColumnsItLacks)
{
    static_cast<void>(open());
    {
        Database file = Database::open(file_);
        ASSERT_TRUE(file.execute(
            "ALTER TABLE runs DROP COLUMN tool; ALTER TABLE runs DROP COLUMN problemKinds;"
            "ALTER TABLE runs DROP COLUMN losses; ALTER TABLE records DROP COLUMN page;"
            "ALTER TABLE records DROP COLUMN pageRecords; PRAGMA user_version = 1;"
            "INSERT INTO volumes (key) VALUES ('v');"
            "INSERT INTO runs (volume, started, finished, action, verdict, error, message) "
            "VALUES (1, 5, 6, 'verify', 'damaged', 7, 'why');"
            "INSERT INTO shapes (shape) VALUES ('[[\"fsck_message\", \"M\", null]]');"
            "INSERT INTO records (id, shape, message, time) "
            "VALUES ((1 << 36) + 7, 1, 'of an earlier program', 5)"));
    }
    const RunEnd end{"repaired", 0, "", "fsck.fat 4.2", 1, 1, true};
    {
        HistoryStore mine = open();
        mine.endRun(mine.beginRun("v", "verify", {}), end, {});
        ASSERT_TRUE(mine.append("v", lines(0, 3), 0));
    }
    HistoryStore mine = open();
    ASSERT_EQ(loaded(mine, "v").size(), 4U);
    EXPECT_EQ(loaded(mine, "v").front().dictionary().entries()[0].value,
              Value("of an earlier program"));
    const auto runs = mine.runs("v");
    ASSERT_EQ(runs.size(), 2U);
    EXPECT_EQ(runs[0].end, (RunEnd{"damaged", 7, "why"})) << "nothing is made up";
    EXPECT_EQ(runs[1].end, end);
    EXPECT_TRUE(warnings_.empty());
}

/// As a module begins a run.
Dictionary startOfRun(std::string_view title)
{
    return Dictionary::of({{contract::kFsckMessageString, title}, {contract::kFsckVerbosity, -1}});
}

// By the time at which the first record of each was saved.
TEST_F(HistoryTest, RunsAreFoundByTheRecordsTheyBeginWith)
{
    const auto recordOf = [](DiskHistories& histories, const DiskFacts& disk, const char* title) {
        for (const Value& record : histories.historyOf(disk).values())
            if (record.dictionary().string(contract::kFsckMessageString) == title)
                return record.dictionary();
        return Dictionary();
    };
    const auto action = [&](DiskHistories& histories, const DiskFacts& disk, const char* title) {
        const auto known = histories.runOf(recordOf(histories, disk, title));
        return !known ? "unknown" : known->run ? known->run->action : "none";
    };
    const DiskFacts other = device("/dev/z", "another");
    const auto check = [&](DiskHistories& histories, const char* when) {
        EXPECT_EQ(action(histories, disk_, "first"), "verify") << when;
        EXPECT_EQ(action(histories, disk_, "never began"), "none") << when;
        EXPECT_EQ(action(histories, disk_, "third"), "repair") << when;
        EXPECT_EQ(action(histories, other, "of another"), "undo") << when;
        EXPECT_EQ(action(histories, disk_, "message"), "unknown") << when;
        EXPECT_FALSE(histories.isNewestStart(recordOf(histories, disk_, "first"))) << when;
        EXPECT_TRUE(histories.isNewestStart(recordOf(histories, disk_, "third"))) << when;
    };
    HistoryStore mine = open();
    {
        DiskHistories histories(mine);
        histories.rememberCleared();
        const auto begin = [&](const DiskFacts& disk, const char* title, const char* run) {
            histories.historyOf(disk).append(startOfRun(title));
            EXPECT_FALSE(histories.runOf(histories.historyOf(disk).back().dictionary()));
            histories.saveNew();
            if (run != nullptr)
                mine.endRun(mine.beginRun(histories.keyOf(disk), run, Run::Time::clock::now()),
                            {"sound", 0, ""}, Run::Time::clock::now());
            std::this_thread::sleep_for(std::chrono::milliseconds(2));
            histories.historyOf(disk).append(
                Dictionary::of({{contract::kFsckMessageString, "message"},
                                {contract::kFsckVerbosity, -1},
                                {contract::Name("kOV_typeOfOutputKey"), "kOV_typeOfOutput_dict"}}));
            histories.saveNew();
        };
        begin(disk_, "first", "verify");
        begin(disk_, "never began", nullptr);
        begin(other, "of another", "undo");
        begin(disk_, "third", "repair");
        check(histories, "while the program runs");
        EXPECT_TRUE(histories.clearHistoryOf(disk_));
        EXPECT_FALSE(histories.isNewestStart(startOfRun("third")));
        histories.restoreCleared();
        check(histories, "after clearing was undone");
        histories.historyOf(disk_).append(lines(0, 5000));
        histories.saveNew();
    }
    DiskHistories later(mine);
    later.loadGradually([] {});
    for (const DiskFacts* const disk : {&other, &disk_})
        EXPECT_FALSE(later.historyOf(*disk).isEmpty());
    EXPECT_TRUE(later.loadAll());
    check(later, "read again, in two steps");
}

TEST_F(HistoryTest, WhatAnotherProgramHoldsUpIsWrittenLater)
{
    HistoryStore mine = open();
    ASSERT_TRUE(mine.append("v", lines(1, 2), 0));
    Database other = Database::open(file_);
    ASSERT_TRUE(other.execute("BEGIN IMMEDIATE"));
    const auto run = mine.beginRun("v", "verify", {});
    for (int i = 0; i < 20; ++i)
        EXPECT_FALSE(mine.append("v", lines(1, 3), 1));
    mine.endRun(run, {"sound", 0, ""}, {});
    ASSERT_TRUE(other.execute("COMMIT"));
    EXPECT_TRUE(mine.append("v", lines(1, 3), 1));
    ASSERT_TRUE(mine.lastRun("v"));
    EXPECT_EQ(mine.lastRun("v")->verdict(), "sound");
    EXPECT_EQ(warnings_.size(), 1U);
}

TEST_F(HistoryTest, WhatAnotherProgramAddsIsTakenIn)
{
    HistoryStore mine = open();
    HistoryStore theirs = open();
    DiskHistories histories(mine);
    const std::string key = histories.keyOf(disk_);
    histories.historyOf(disk_).append(line(1));
    histories.saveNew();
    (void)mine.hasForeignChanges();
    EXPECT_FALSE(mine.hasForeignChanges());
    histories.historyOf(disk_).append(line(2));
    EXPECT_FALSE(histories.takeInOthers()) << "what is one’s own is there already";
    EXPECT_FALSE(mine.hasForeignChanges());

    ASSERT_TRUE(theirs.append(key, lines(3, 5), 0));
    EXPECT_TRUE(mine.hasForeignChanges());
    const std::uint64_t before = histories.revision();
    EXPECT_TRUE(histories.takeInOthers());
    EXPECT_NE(histories.revision(), before);
    EXPECT_EQ(histories.historyOf(disk_).size(), 4U);
    ASSERT_TRUE(theirs.clear(key));
    EXPECT_TRUE(histories.takeInOthers());
    EXPECT_EQ(histories.historyOf(disk_).size(), 0U);
}

TEST_F(HistoryTest, WhatTheStoreHasDroppedIsNotTakenForAnothersChange)
{
    limits_.recordsOfVolume = 10;
    HistoryStore store = open();
    DiskHistories histories(store);
    for (int i = 0; i < 30; ++i) {
        histories.historyOf(disk_).append(line(i));
        histories.saveNew();
    }
    ASSERT_LT(store.recordsOf(histories.keyOf(disk_)).size(), 30);
    EXPECT_FALSE(histories.takeInOthers());
    EXPECT_EQ(histories.historyOf(disk_).size(), 30U);
    (void)histories.clearHistoryOf(disk_);
    EXPECT_FALSE(histories.takeInOthers());
}

TEST_F(HistoryTest, CopiesOfAVolumeAreNotMixed)
{
    HistoryStore mine = open();
    DiskHistories histories(mine);
    const std::string key = histories.keyOf(device("/dev/sda1", "u"));
    EXPECT_EQ(DiskHistories(mine).keyOf(device("/dev/sdb1", "u")), key) << "a new name, the same";
    EXPECT_NE(histories.keyOf(device("/dev/sdb1", "u")), key) << "both are known at once";
    DiskFacts image = device("/a.img#1", "i");
    image.storage = contract::DiskReference::Storage::FileRegion;
    DiskFacts copy = image;
    copy.identifier = "/b.img#1";
    EXPECT_NE(DiskHistories(mine).keyOf(image), DiskHistories(mine).keyOf(copy));

    DiskHistories others(mine);
    others.askForDevices([](const std::string&) {
        return std::vector<std::string>{"/dev/sda1", "/dev/sdb1"};
    });
    image.uuid = "u";
    EXPECT_NE(others.keyOf(image), key);
    EXPECT_NE(others.keyOf(device("/dev/sdb1", "u")), key) << "it is there though nobody asked";
    EXPECT_EQ(others.keyOf(device("/dev/sda1", "u")), key);
}

TEST_F(HistoryTest, ALongOneComesInTwoStepsAndTakesNewRecordsInBetween)
{
    constexpr int count = 10'000;
    {
        HistoryStore mine = open();
        ASSERT_TRUE(mine.append(DiskHistories(mine).keyOf(disk_), lines(0, count), 0));
        DiskHistories histories(mine);
        histories.loadGradually([] {});
        const Array newest = histories.historyOf(disk_);
        EXPECT_LT(newest.size(), 5000U);
        EXPECT_EQ(exactly(newest.back()), exactly(line(count - 1)));
        const auto revision = histories.revision();
        EXPECT_EQ(histories.loadMore(), DiskHistories::Progress::More);
        newest.append(line(count));
        histories.saveNew();
        newest.append(line(count + 1));  // not saved yet when the list becomes another
        EXPECT_TRUE(histories.loadAll());
        EXPECT_NE(histories.revision(), revision) << "whoever holds the list must ask again";
        histories.historyOf(disk_).append(line(count + 2));
        histories.saveNew();
        EXPECT_FALSE(histories.loadAll()) << "all are there";
    }
    HistoryStore mine = open();
    EXPECT_EQ(exactly(loaded(mine, DiskHistories(mine).keyOf(disk_))),
              exactly(lines(0, count + 3)));
}

TEST_F(HistoryTest, ALongOneThatIsClearedWhileItComesStaysClear)
{
    HistoryStore mine = open();
    ASSERT_TRUE(mine.append(DiskHistories(mine).keyOf(disk_), lines(0, 9000), 0));
    DiskHistories histories(mine);
    histories.loadGradually([] {});
    ASSERT_FALSE(histories.historyOf(disk_).isEmpty());
    EXPECT_TRUE(histories.clearHistoryOf(disk_));
    EXPECT_FALSE(histories.loadAll());
    histories.saveNew();
    EXPECT_EQ(mine.recordsOf(histories.keyOf(disk_)).size(), 0);
}

TEST_F(HistoryTest, AListThatWasEmptiedAndFilledAgainIsSavedAnew)
{
    {
        HistoryStore mine = open();
        DiskHistories histories(mine);
        const Array history = histories.historyOf(disk_);
        history.append(lines(1, 3));
        histories.saveNew();
        histories.saveNew();
        EXPECT_EQ(loaded(mine, histories.keyOf(disk_)).size(), 2U) << "each once";
        history.removeAll();
        history.append(lines(3, 6));
        histories.saveNew();
    }
    HistoryStore mine = open();
    DiskHistories histories(mine);
    EXPECT_EQ(exactly(histories.historyOf(disk_)), exactly(lines(3, 6)));
    EXPECT_TRUE(histories.clearHistoryOf(disk_));
    EXPECT_TRUE(loaded(mine, histories.keyOf(disk_)).isEmpty());
}

// Volumes are checked in any order, and the programs end in between.
TEST_F(HistoryTest, AWholeDiskShowsItsRecordsInTheOrderOfTime)
{
    DiskTree tree{device("sda"), {}};
    for (const char* const name : {"sda1", "sda2", "sda3"})
        tree.children.push_back({device(name), {}});
    std::string all;
    for (const bool isWatched : {true, false}) {
        HistoryStore store = open();
        DiskHistories histories(store);
        const auto disk = Disk::make(tree, {{}, &histories});
        const auto shown = [&] {
            std::string text;
            for (const Value& record : disk->fsckHistory().values())
                text += std::to_string(record.dictionary().integer(contract::kFsckVerbosity)) + " ";
            return text;
        };
        const auto say = [&](int part, int number) {
            disk->parts()[static_cast<std::size_t>(part)]->fsckHistoryNoChildren().append(
                Dictionary::of({{contract::kFsckVerbosity, number}}));
            all += std::to_string(number) + " ";
            EXPECT_TRUE(!isWatched || shown() == all) << shown() << "instead of " << all;
        };
        EXPECT_EQ(static_cast<bool>(disk->fsckHistory()), !all.empty()) << "none was ever checked";
        for (const int part : {2, 0, 1, 0, 2}) {
            say(part, 1 + 10 * part);
            histories.saveNew();
            ::usleep(3000);
            say(part, 2 + 10 * part);
        }
        histories.saveNew();
        ::usleep(3000);
        EXPECT_EQ(shown(), all);
        if (isWatched)
            continue;
        // As many as before, but others.
        disk->parts()[0]->clearFsckHistory();
        for (const int number : {5, 6, 7, 8})
            disk->parts()[0]->fsckHistoryNoChildren().append(
                Dictionary::of({{contract::kFsckVerbosity, number}}));
        EXPECT_NE(shown(), all);
        EXPECT_TRUE(disk->clearFsckHistory());
        EXPECT_FALSE(disk->clearFsckHistory()) << "nothing was left";
    }
}

// As a device that cannot be read for a moment has none.
TEST_F(HistoryTest, OnlyAnotherUUIDMakesAnotherHistory)
{
    HistoryStore store = open();
    DiskHistories histories(store);
    const auto disk = Disk::make({device("sda1", "u"), {}}, {{}, &histories});
    disk->fsckHistoryNoChildren().append(line(1));
    disk->setFacts(device("sda1"));
    EXPECT_EQ(disk->fsckHistoryNoChildren().size(), 1U);
    disk->setFacts(device("sda1", "other"));
    EXPECT_EQ(disk->fsckHistoryNoChildren().size(), 0U) << "it was formatted anew";
}

}  // namespace
}  // namespace orvane
