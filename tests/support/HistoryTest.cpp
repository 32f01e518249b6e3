// SPDX-License-Identifier: Apache-2.0
#include "TemporaryDirectory.h"
#include "contract/foundation/StyledText.h"
#include "contract/pellar/MessageKeys.h"
#include "orvane/support/disks/Disk.h"
#include "orvane/support/history/Database.h"
#include "orvane/support/history/DiskHistories.h"
#include "orvane/support/history/HistoryStore.h"
#include "orvane/support/settings/ValueJSON.h"

#include <gtest/gtest.h>
#include <signal.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cmath>

namespace orvane {
namespace {

using contract::Array;
using contract::Dictionary;
using contract::Name;
using contract::StyledText;
using contract::Value;
using test::TemporaryDirectory;
namespace fs = std::filesystem;

const contract::TextStyle red{contract::Font::boldSystem(11), contract::Color{1, 0, 0.25, 1}, {}};

Dictionary line(int number)
{
    return Dictionary::of({{Name("kOV_typeOfOutputKey"), Name("kOV_typeOfOutput_string")},
                           {contract::kFsckVerbosity, 2},
                           {Name("kOV_finalAttributedString_type"),
                            StyledText::make("line " + std::to_string(number) + "\n", red)}});
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
    store.load(store.recordsOf(volume), history);
    return history;
}

struct Store {
    std::filesystem::path file;
    std::vector<std::string> warnings;
    HistoryStore::Limits limits = {};
    HistoryStore open()
    {
        return {file, limits, [this](const std::string& text) {
                    warnings.push_back(text);
                }};
    }
};

TEST(HistoryStore, RecordsComeBackAsTheyWere)
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
    const TemporaryDirectory directory;
    Store store{directory / "state/history.sqlite3", {}};
    ASSERT_TRUE(store.open().append("v", history, 0));
    HistoryStore reopened = store.open();
    EXPECT_EQ(exactly(loaded(reopened, "v")), exactly(history));
    EXPECT_TRUE(loaded(reopened, "another").isEmpty());
    EXPECT_TRUE(store.warnings.empty());
    struct stat status = {};
    ASSERT_EQ(::stat(store.file.c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 0777U, 0600U);
}

TEST(HistoryStore, WhatWasSavedIsThereAfterTheProgramWasKilled)
{
    const TemporaryDirectory directory;
    Store store{directory / "history.sqlite3", {}};
    int ends[2];
    ASSERT_EQ(::pipe(ends), 0);
    const pid_t child = ::fork();
    ASSERT_GE(child, 0);
    if (child == 0) {
        HistoryStore mine = store.open();
        const Array history = Array::make();
        for (int count = 0;; ++count) {
            history.append(line(count));
            const bool isSaved = mine.append("v", history, static_cast<std::size_t>(count));
            if (!isSaved || ::write(ends[1], "x", 1) != 1)
                ::_exit(1);
        }
    }
    char saved = 0;
    int savedCount = 0;
    for (; savedCount < 200 && ::read(ends[0], &saved, 1) == 1; ++savedCount) {
    }
    ::kill(child, SIGKILL);
    int status = 0;
    ::waitpid(child, &status, 0);
    ::close(ends[0]);
    ::close(ends[1]);
    ASSERT_TRUE(WIFSIGNALED(status)) << "the child must not have ended by itself";

    HistoryStore mine = store.open();
    const Array history = loaded(mine, "v");
    ASSERT_GE(history.size(), static_cast<std::size_t>(savedCount));
    for (std::size_t i = 0; i < history.size(); ++i)
        EXPECT_EQ(exactly(history.at(i)), exactly(line(static_cast<int>(i))));
    EXPECT_TRUE(store.warnings.empty());
}

TEST(HistoryStore, TwoProgramsAddToOneVolume)
{
    const TemporaryDirectory directory;
    Store store{directory / "history.sqlite3", {}};
    HistoryStore one = store.open();
    HistoryStore other = store.open();
    for (int i = 0; i < 3; ++i) {
        ASSERT_TRUE(one.append("v", Array::of({line(i)}), 0));
        ASSERT_TRUE(other.append("v", Array::of({line(100 + i)}), 0));
    }
    EXPECT_EQ(loaded(one, "v").size(), 6U);
}

TEST(HistoryStore, OlderRunsAreDroppedWhole)
{
    const TemporaryDirectory directory;
    Store store{directory / "history.sqlite3", {}, {100}};
    HistoryStore mine = store.open();
    const Array run = Array::make();
    for (int i = 0; i < 29; ++i)
        run.append(line(i));
    run.append(summary());
    for (int i = 0; i < 4; ++i)
        ASSERT_TRUE(mine.append("v", run, 0));
    const Array kept = loaded(mine, "v");
    EXPECT_LE(kept.size(), 100U);
    EXPECT_GE(kept.size(), 60U);
    EXPECT_EQ(exactly(kept.front()), exactly(line(0))) << "starts with the start of a run";

    const Array giant = Array::make();
    for (int i = 0; i < 250; ++i)
        giant.append(line(i));
    ASSERT_TRUE(mine.append("v", giant, 0));
    EXPECT_LE(loaded(mine, "v").size(), 100U);
    EXPECT_EQ(exactly(loaded(mine, "v").back()), exactly(line(249))) << "the newest are kept";
}

// As many at once as a flood of output brings: nothing is dropped that must stay, and what must go
// has gone at the latest when the store is closed.
TEST(HistoryStore, AFullVolumeIsTrimmedLittleByLittle)
{
    const TemporaryDirectory directory;
    Store store{directory / "history.sqlite3", {}, {20'000}};
    const Array portion = Array::make();
    for (int i = 0; i < 2000; ++i)
        portion.append(line(i));
    {
        HistoryStore mine = store.open();
        std::int64_t most = 0;
        for (int i = 0; i < 40; ++i) {
            const auto before = mine.recordsOf("v");
            ASSERT_TRUE(mine.append("v", portion, 0));
            const auto after = mine.recordsOf("v");
            most = std::max(most, after.size());
            EXPECT_LE(i == 0 ? 0 : after.next - before.next, 5000) << "dropped at once";
        }
        EXPECT_LE(most, 25'000);
    }
    HistoryStore mine = store.open();
    EXPECT_LE(mine.recordsOf("v").size(), 20'000);
    EXPECT_GE(mine.recordsOf("v").size(), 15'000);
}

TEST(HistoryStore, ADamagedDatabaseIsKeptAsideAndANewOneBegun)
{
    const TemporaryDirectory directory;
    Store store{directory / "history.sqlite3", {}};
    test::write(store.file, "this is no database, but somebody's thesis");
    HistoryStore mine = store.open();
    ASSERT_EQ(store.warnings.size(), 1U);
    EXPECT_TRUE(mine.isKept());
    EXPECT_TRUE(mine.append("v", Array::of({line(1)}), 0));
    bool isAside = false;
    for (const auto& file : fs::directory_iterator(directory.path))
        isAside = isAside || test::contentsOf(file.path()).ends_with("thesis");
    EXPECT_TRUE(isAside) << "nothing is thrown away";
}

TEST(HistoryStore, DamageThatShowsOnlyLaterIsSetAsideAndEverythingSavedAgain)
{
    const TemporaryDirectory directory;
    Store store{directory / "history.sqlite3", {}};
    DiskFacts disk;
    disk.identifier = "/dev/x";
    DiskFacts damaged;
    damaged.identifier = "/dev/y";
    const Array lines = Array::make();
    for (int i = 0; i < 5000; ++i)
        lines.append(line(i));
    {
        HistoryStore mine = store.open();
        ASSERT_TRUE(mine.append(DiskHistories(mine).keyOf(damaged), lines, 0));
    }
    HistoryStore mine = store.open();
    DiskHistories histories(mine);
    histories.historyOf(disk).append(line(1));
    histories.saveNew();
    {
        std::fstream file(store.file, std::ios::in | std::ios::out | std::ios::binary);
        file.seekp(20 * 4096);
        file << std::string(20 * 4096, '\x5A');
    }
    EXPECT_LT(histories.historyOf(damaged).size(), 5000U) << "what could still be read";
    EXPECT_EQ(store.warnings.size(), 1U);
    histories.saveNew();
    EXPECT_EQ(loaded(mine, histories.keyOf(disk)).size(), 1U) << "saved again in the new database";
}

TEST(HistoryStore, WhatCannotBeKeptHoldsInMemoryWithOneWarning)
{
    const TemporaryDirectory directory;
    test::write(directory / "file", "");
    fs::create_directory(directory / "directory");
    for (const char* const name : {"file/history.sqlite3", "directory"}) {
        Store store{directory / name, {}};
        HistoryStore mine = store.open();
        EXPECT_FALSE(mine.isKept());
        EXPECT_TRUE(mine.append("v", Array::of({line(1)}), 0));
        const auto run = mine.beginRun("v", "verify", {});
        mine.endRun(run, {"sound", 0, ""}, {});
        EXPECT_TRUE(mine.lastRun("v") && mine.lastRun("v")->end) << "runs are still known";
        EXPECT_EQ(store.warnings.size(), 1U) << name;
    }
}

TEST(HistoryStore, RunsAreKeptAndCutOffOnesStayOpen)
{
    const TemporaryDirectory directory;
    Store store{directory / "history.sqlite3", {}};
    const Run::Time start(std::chrono::seconds(1000));
    const RunEnd end{"damaged", -69701, "cannot ‘\x1b’"};
    {
        HistoryStore mine = store.open();
        mine.endRun(mine.beginRun("v", "verify", start), end, start + std::chrono::seconds(5));
        mine.beginRun("v", "repair", start);
    }
    HistoryStore mine = store.open();
    const auto runs = mine.runs("v");
    ASSERT_EQ(runs.size(), 2U);
    EXPECT_EQ(runs[0].action, "verify");
    EXPECT_EQ(runs[0].end, end);
    EXPECT_EQ(runs[0].finished, start + std::chrono::seconds(5));
    EXPECT_FALSE(runs[1].end) << "the program ended in the middle of it";
    EXPECT_EQ(runs[1].verdict(), "running") << "this program is still there";
    EXPECT_EQ(mine.lastRun("v")->action, "repair");
    EXPECT_FALSE(mine.lastRun("w"));

    Database file = Database::open(store.file);
    for (const char* const program : {"owner || '1'", "'other ' || owner", "''", "'a ../self 1'"}) {
        ASSERT_TRUE(file.execute(
            ("UPDATE openRuns SET owner = " + std::string(program)).c_str()));
        EXPECT_EQ(mine.lastRun("v")->verdict(), "") << "cut off with its program: " << program;
    }
}

TEST(HistoryStore, WhatAnotherProgramHoldsUpIsWrittenLater)
{
    const TemporaryDirectory directory;
    Store store{directory / "history.sqlite3", {}};
    HistoryStore mine = store.open();
    ASSERT_TRUE(mine.append("v", Array::of({line(1)}), 0));
    Database other = Database::open(store.file);
    ASSERT_TRUE(other.execute("BEGIN IMMEDIATE"));
    const auto before = std::chrono::steady_clock::now();
    const auto run = mine.beginRun("v", "verify", {});
    for (int i = 0; i < 20; ++i)
        EXPECT_FALSE(mine.append("v", Array::of({line(1), line(2)}), 1));
    mine.endRun(run, {"sound", 0, ""}, {});
    EXPECT_LT(std::chrono::steady_clock::now() - before, std::chrono::seconds(20))
        << "it is waited for once, and not for each record";
    ASSERT_TRUE(other.execute("COMMIT"));
    EXPECT_TRUE(mine.append("v", Array::of({line(1), line(2)}), 1));
    ASSERT_TRUE(mine.lastRun("v"));
    EXPECT_EQ(mine.lastRun("v")->verdict(), "sound");
    EXPECT_EQ(store.warnings.size(), 1U);
}

TEST(HistoryStore, ALinkIsNotFollowedAndTheReasonOfAFailureIsItsOwn)
{
    const TemporaryDirectory directory;
    fs::create_symlink(directory / "victim", directory / "history.sqlite3");
    Store store{directory / "history.sqlite3", {}};
    EXPECT_FALSE(store.open().isKept());
    EXPECT_FALSE(fs::exists(directory / "victim"));

    Database database = Database::inMemory();
    ASSERT_TRUE(database.execute("PRAGMA max_page_count = 2; CREATE TABLE t (a)"));
    {
        const Transaction transaction(database);
        EXPECT_FALSE(database.execute("INSERT INTO t VALUES (zeroblob(100000))"));
    }
    EXPECT_EQ(database.lastError(), "database or disk is full");
}

TEST(HistoryKey, CopiesOfAVolumeAreNotMixed)
{
    DiskFacts device;
    device.identifier = "/dev/sda1";
    device.uuid = "u";
    DiskFacts copy = device;
    copy.identifier = "/dev/sdb1";
    EXPECT_EQ(historyKeyOf(device, false), historyKeyOf(copy, false)) << "a new name, the same";
    EXPECT_NE(historyKeyOf(device, false), historyKeyOf(copy, true)) << "both are known at once";
    DiskFacts image = device;
    image.storage = contract::DiskReference::Storage::FileRegion;
    image.identifier = "/a.img#1";
    DiskFacts imageCopy = image;
    imageCopy.identifier = "/b.img#1";
    EXPECT_NE(historyKeyOf(image, false), historyKeyOf(imageCopy, false));
}

TEST(DiskHistories, ALongOneComesInTwoStepsAndTakesNewRecordsInBetween)
{
    constexpr int count = 10'000;
    const TemporaryDirectory directory;
    Store store{directory / "history.sqlite3", {}};
    DiskFacts disk;
    disk.identifier = "/dev/x";
    {
        HistoryStore mine = store.open();
        DiskHistories histories(mine);
        for (int i = 0; i < count; ++i)
            histories.historyOf(disk).append(line(i));
        histories.saveNew();
    }
    {
        HistoryStore mine = store.open();
        DiskHistories histories(mine);
        int begun = 0;
        histories.loadGradually([&begun] { ++begun; });
        const Array newest = histories.historyOf(disk);
        EXPECT_EQ(begun, 1);
        EXPECT_LT(newest.size(), 5000U);
        EXPECT_EQ(exactly(newest.back()), exactly(line(count - 1)));
        const auto revision = histories.revision();
        EXPECT_EQ(histories.loadMore(), DiskHistories::Progress::More);
        newest.append(line(count));
        histories.saveNew();
        newest.append(line(count + 1));  // not saved yet when the list becomes another
        EXPECT_TRUE(histories.loadAll());
        EXPECT_NE(histories.revision(), revision) << "whoever holds the list must ask again";
        histories.historyOf(disk).append(line(count + 2));
        histories.saveNew();
        EXPECT_FALSE(histories.loadAll()) << "all are there";
    }
    HistoryStore mine = store.open();
    const Array all = loaded(mine, DiskHistories(mine).keyOf(disk));
    ASSERT_EQ(all.size(), static_cast<std::size_t>(count + 3));
    for (int i : {0, 3999, 4000, 5999, 6000, count - 1, count, count + 1, count + 2})
        EXPECT_EQ(exactly(all.at(static_cast<std::size_t>(i))), exactly(line(i)));
}

TEST(DiskHistories, ALongOneThatIsClearedWhileItComesStaysClear)
{
    const TemporaryDirectory directory;
    Store store{directory / "history.sqlite3", {}};
    HistoryStore mine = store.open();
    DiskFacts disk;
    disk.identifier = "/dev/x";
    const Array lines = Array::make();
    for (int i = 0; i < 9000; ++i)
        lines.append(line(i));
    ASSERT_TRUE(mine.append(DiskHistories(mine).keyOf(disk), lines, 0));
    DiskHistories histories(mine);
    histories.loadGradually([] {});
    ASSERT_FALSE(histories.historyOf(disk).isEmpty());
    EXPECT_TRUE(histories.clearHistoryOf(disk));
    EXPECT_FALSE(histories.loadAll());
    EXPECT_TRUE(histories.historyOf(disk).isEmpty());
    histories.saveNew();
    EXPECT_EQ(mine.recordsOf(histories.keyOf(disk)).size(), 0);
}

TEST(DiskHistories, SaveWhatIsNewAndSeeAListThatWasEmptiedBehindTheirBack)
{
    const TemporaryDirectory directory;
    Store store{directory / "history.sqlite3", {}};
    DiskFacts disk;
    disk.identifier = "/dev/x";
    {
        HistoryStore mine = store.open();
        DiskHistories histories(mine);
        const Array history = histories.historyOf(disk);
        history.append(line(1));
        history.append(line(2));
        histories.saveNew();
        histories.saveNew();
        EXPECT_EQ(loaded(mine, histories.keyOf(disk)).size(), 2U) << "each once";
        history.removeAll();
        history.append(line(3));
        history.append(line(4));
        history.append(line(5));
        histories.saveNew();
    }
    HistoryStore mine = store.open();
    DiskHistories histories(mine);
    EXPECT_EQ(exactly(histories.historyOf(disk)), exactly(Array::of({line(3), line(4), line(5)})));
    EXPECT_TRUE(histories.clearHistoryOf(disk));
    EXPECT_FALSE(histories.clearHistoryOf(disk));
    EXPECT_TRUE(loaded(mine, histories.keyOf(disk)).isEmpty());
}

// Volumes are checked in any order, and the programs end in between.
TEST(DiskHistories, AWholeDiskShowsItsRecordsInTheOrderOfTime)
{
    const TemporaryDirectory directory;
    DiskTree tree;
    tree.facts.identifier = "sda";
    for (const char* const name : {"sda1", "sda2", "sda3"}) {
        tree.children.push_back({});
        tree.children.back().facts.identifier = name;
    }
    const auto later = [] {
        ::usleep(3000);
    };
    std::string all;
    for (const bool isWatched : {true, false}) {
        HistoryStore store(directory / "history.sqlite3", {}, [](const std::string&) {});
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
            if (isWatched) {
                EXPECT_EQ(shown(), all);
            }
        };
        EXPECT_EQ(static_cast<bool>(disk->fsckHistory()), !all.empty()) << "none was ever checked";
        for (const int part : {2, 0, 1, 0, 2}) {
            say(part, 1 + 10 * part);
            histories.saveNew();
            later();
            say(part, 2 + 10 * part);
        }
        histories.saveNew();
        later();
        EXPECT_EQ(shown(), all);
    }
}

}  // namespace
}  // namespace orvane
