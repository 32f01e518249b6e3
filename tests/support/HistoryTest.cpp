// SPDX-License-Identifier: Apache-2.0
#include "TemporaryDirectory.h"
#include "fixwell/host/foundation/StyledText.h"
#include "fixwell/host/pellar/MessageKeys.h"
#include "orvane/support/history/DiskHistories.h"
#include "orvane/support/history/HistoryKey.h"
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

using fixwell::Array;
using fixwell::Dictionary;
using fixwell::Name;
using fixwell::StyledText;
using fixwell::Value;
using test::TemporaryDirectory;
namespace fs = std::filesystem;

const fixwell::TextStyle red{fixwell::Font::boldSystem(11), fixwell::Color{1, 0, 0.25, 1}, {}};

Dictionary line(int number)
{
    return Dictionary::of({{Name("kOV_typeOfOutputKey"), Name("kOV_typeOfOutput_string")},
                           {fixwell::kFsckVerbosity, 2},
                           {Name("kOV_finalAttributedString_type"),
                            StyledText::make("line " + std::to_string(number) + "\n", red)}});
}

Dictionary summary()
{
    return Dictionary::of({{fixwell::kFsckVerbosity, -2}, {fixwell::kFsckError, 3}});
}

/// A record as exact text: kinds, order, styles and bytes.
std::string exactly(const Value& value)
{
    return jsonFromValue(value).dump();
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
         Dictionary::of({{fixwell::kFsckMessageType, fixwell::kFsckError},
                         {fixwell::kFsckMessageString, "Entry %1$@ is %2$@"},
                         {fixwell::kFsckParameters, Array::of({"x", 2, 2.0, true, hostile})},
                         {fixwell::kFsckVerbosity, -1},
                         {Name("kOV_typeOfOutputKey"), Name("kOV_typeOfOutput_dict")},
                         {Name("kOV_finalAttributedString_type"), twoStyles}}),
         // The same keys, but not of the kinds that they have in good order.
         Dictionary::of({{fixwell::kFsckVerbosity, 1.5},
                         {fixwell::kFsckMessageType, 7},
                         {Name("kOV_typeOfOutputKey"), "made up"},
                         {Name("kOV_finalAttributedString_type"), hostile}}),
         Dictionary::of({{Name("kOV_finalAttributedString_type"), StyledText::make("", red)},
                         {fixwell::kFsckMessageType, ""},
                         {Name(hostile), Dictionary::of({{Name("deep"), Array::make()}})},
                         {Name("infinite"), -INFINITY}}),
         Dictionary::make(), summary()});
    const TemporaryDirectory directory;
    Store store{directory / "state/history.sqlite3", {}};
    ASSERT_TRUE(store.open().append("v", history, 0));
    HistoryStore reopened = store.open();
    EXPECT_EQ(exactly(reopened.load("v")), exactly(history));
    EXPECT_TRUE(reopened.load("another").isEmpty());
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

    const Array history = store.open().load("v");
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
    EXPECT_EQ(one.load("v").size(), 6U);
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
    const Array kept = mine.load("v");
    EXPECT_LE(kept.size(), 100U);
    EXPECT_GE(kept.size(), 60U);
    EXPECT_EQ(exactly(kept.front()), exactly(line(0))) << "starts with the start of a run";

    const Array giant = Array::make();
    for (int i = 0; i < 250; ++i)
        giant.append(line(i));
    ASSERT_TRUE(mine.append("v", giant, 0));
    EXPECT_LE(mine.load("v").size(), 100U);
    EXPECT_EQ(exactly(mine.load("v").back()), exactly(line(249))) << "the newest are kept";
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
    EXPECT_EQ(mine.load(histories.keyOf(disk)).size(), 1U) << "saved again in the new database";
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
    EXPECT_EQ(mine.lastRun("v")->action, "repair");
    EXPECT_FALSE(mine.lastRun("w"));
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
    image.storage = fixwell::DiskReference::Storage::FileRegion;
    image.identifier = "/a.img#1";
    DiskFacts imageCopy = image;
    imageCopy.identifier = "/b.img#1";
    EXPECT_NE(historyKeyOf(image, false), historyKeyOf(imageCopy, false));
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
        EXPECT_EQ(mine.load(histories.keyOf(disk)).size(), 2U) << "each once";
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
    EXPECT_TRUE(mine.load(histories.keyOf(disk)).isEmpty());
}

}  // namespace
}  // namespace orvane
