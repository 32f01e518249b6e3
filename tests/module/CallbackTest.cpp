// SPDX-License-Identifier: Apache-2.0
#include "tests/module/ModuleTest.h"

namespace fixwell {
namespace {

Dictionary lastRecord(const std::shared_ptr<testing::FakeDisk>& disk)
{
    return disk->history.back().dictionary();
}

Dictionary message(std::string_view type, std::string_view text, Value verbosity = {})
{
    const Dictionary made = Dictionary::make();
    if (!type.empty())
        made.set(kFsckMessageType, type);
    if (!text.empty())
        made.set(kFsckMessageString, text);
    made.set(kFsckVerbosity, std::move(verbosity));
    return made;
}

}  // namespace

TEST_F(OVFXWTest, ToolLinesBecomeTypedRecords)
{
    struct Case {
        std::string_view line;
        std::string_view text;
        std::string_view type;
        std::int64_t level;
    };
    const auto disk = addDisk("a");
    verify(disk);
    for (const Case& c :
         {Case{"** The volume X appears to be OK.\n", "** The volume X appears to be OK.\n",
               "SUCCESS", 0},
          Case{"The volume X needs to be repaired.", "The volume X needs to be repaired.\n",
               "ERROR", 0},
          Case{"needs to be repaired. appears to be OK.", "needs to be repaired. appears to be OK.",
               "SUCCESS", 0},
          Case{"Rebuilding Catalog B-tree.\n", "Rebuilding Catalog B-tree.\n", "REPAIR", 0},
          Case{"Checking file system.\n", "Checking file system.\n", "", 2},
          Case{"x \x1b[31mbad block\x1b[0m y", "bad block\x1b\n", "ERROR", 0},
          Case{"[31mbad[30m", "bad\n", "ERROR", 0},
          Case{"[0m then [31mkept whole", "[0m then [31mkept whole\n", "ERROR", 0},
          Case{"[31mno end", "[31mno end\n", "ERROR", 0}}) {
        say(disk, c.line);
        const Dictionary record = lastRecord(disk);
        EXPECT_EQ(finalText(record).characters(), c.text);
        EXPECT_EQ(record.string(kFsckMessageType), c.type) << c.line;
        EXPECT_EQ(verbosityOf(record), c.level) << c.line;
        EXPECT_EQ(record.string(kOV_typeOfOutputKey), "kOV_typeOfOutput_string");
    }
    finish(disk);
    module->verifyPermissions(nullptr);
    say(disk, "appears to be OK.");
    EXPECT_EQ(verbosityOf(lastRecord(disk)), 2) << "only disk jobs are classified";
    EXPECT_FALSE(lastRecord(disk).has(kFsckMessageType));
}

TEST_F(OVFXWTest, PhrasesFollowTheLanguageAtOnce)
{
    const auto disk = addDisk("a");
    verify(disk);
    say(disk, "DAS VOLUME IST ÜBERPRÜFT.\n");
    EXPECT_EQ(verbosityOf(lastRecord(disk)), 2);
    host.translations["LocalizableFsck/appears to be OK."] = "ist überprüft.";
    ++host.revision;
    say(disk, "DAS VOLUME IST ÜBERPRÜFT.\n");
    EXPECT_EQ(lastRecord(disk).string(kFsckMessageType), "SUCCESS") << "letters beyond ASCII too";
    say(disk, "needs to be repaired.\n");
    EXPECT_EQ(lastRecord(disk).string(kFsckMessageType), "ERROR") << "untranslated: the key";
}

TEST_F(OVFXWTest, LibraryMessagesBecomeRecords)
{
    struct Case {
        Dictionary message;
        std::int64_t level;
        bool isBold;
        std::optional<Color> color;
    };
    const Color red{1, 0, 0, 1};
    const Color green{0, 0.8, 0.2, 1};
    const auto disk = addDisk("a");
    select(disk);
    module->repairDisk(nullptr);
    for (const Case& c :
         {Case{message("VERIFY", "step", 2), 1, false, {}},
          Case{message("REPAIR", "step"), 1, false, {}},
          Case{message("ERROR", "bad", 2), -1, false, red},
          Case{message("ERROR", "bad", -1), -1, true, red},
          Case{message("FAIL", "no", 0), 0, false, red},
          Case{message("SUCCESS", "ok", -1), -1, true, green},
          Case{message("", "x", 2), 2, false, {}}, Case{message("", "x"), 0, false, {}}}) {
        say(disk, c.message);
        const Dictionary record = lastRecord(disk);
        EXPECT_EQ(verbosityOf(record), c.level);
        EXPECT_EQ(finalText(record).style().font, (Font{c.isBold, 11}));
        EXPECT_EQ(finalText(record).style().color, c.color);
        EXPECT_EQ(finalText(record).characters().back(), '\n');
        EXPECT_FALSE(record.isSameAs(c.message)) << "the library's dictionary is copied";
    }
    module->plAsyncMessageForDisk(disk->reference, "instead", message("VERIFY", "built"));
    EXPECT_EQ(finalText(lastRecord(disk)).characters(), "instead\n");
}

TEST_F(OVFXWTest, ParametersFillTheNumberedPlaceholders)
{
    struct Case {
        std::string_view text;
        Array parameters;
        std::string_view shown;
    };
    const auto disk = addDisk("a");
    verify(disk);
    const Dictionary named = Dictionary::of({{Name("name"), "first"}, {Name("other"), "second"}});
    for (const Case& c :
         {Case{"%1$@ of %2$@", Array::of({"inode", 1234567}), "inode of 1,234,567\n"},
          Case{"%2$@ %2$@ %3$@ %@", Array::of({"unused", "x"}), "x x %3$@ %@\n"},
          Case{"%1$@", Array::of({named}), "first\n"},
          Case{"%1$@.", Array::of({Array::make()}), ".\n"}, Case{"100%", {}, "100%\n"},
          Case{"%1$@%11$@",
               Array::of({"1", "2", "3", "4", "5", "6", "7", "8", "9", "10", "eleven"}),
               "1eleven\n"}}) {
        const Dictionary made = message("VERIFY", c.text);
        made.set(kFsckParameters, c.parameters);
        say(disk, made);
        EXPECT_EQ(finalText(lastRecord(disk)).characters(), c.shown);
    }
}

TEST_F(OVFXWTest, WhatBelongsToNobodyIsDropped)
{
    const auto disk = addDisk("a");
    const auto other = addDisk("b");
    disk->history = Array::make();
    say(disk, "line");
    say(disk, message("VERIFY", "step"));
    appendMessage("heading");
    EXPECT_TRUE(disk->history.isEmpty());

    verify(disk);
    say(other, "for another disk");
    EXPECT_EQ(linesOf(disk).back(), "for another disk") << "filed under the disk in flight";
    module->plAsyncMessageForDisk(nullptr, "from no disk", {});
    EXPECT_EQ(linesOf(disk).back(), "for another disk");
}

// Progress

TEST_F(OVFXWTest, ProgressCountsTheWholeJob)
{
    const auto first = addDisk("a");
    const auto second = addDisk("b");
    verify(first, second, addDisk("c"));
    for (const float ignored : {0.0F, 100.0F, -1.0F, 250.0F})
        progress(first, ignored);
    EXPECT_TRUE(host.isIndeterminate);
    progress(first, 30);
    EXPECT_FALSE(host.isIndeterminate);
    EXPECT_FLOAT_EQ(static_cast<float>(host.progress), 10.0F);
    finish(first);
    say(second,
        Dictionary::of({{kFsckMessageType, kFsckProgress}, {kFsckParameters, Array::of({50})}}));
    EXPECT_FLOAT_EQ(static_cast<float>(host.progress), 50.0F);
    EXPECT_EQ(linesOf(second).size(), 1U) << "progress without text is no record";
}

TEST_F(OVFXWTest, ThePermissionsDatabaseIsAnnouncedOnce)
{
    struct Case {
        float first;
        bool isAnnounced;
        double after60;
    };
    for (const Case& c : {Case{20.0F, true, 50}, Case{20.5F, false, 60}, Case{19.9F, false, 60}}) {
        const auto disk = addDisk("p" + std::to_string(c.first));
        select(disk);
        module->verifyPermissions(nullptr);
        progress(disk, c.first);
        EXPECT_EQ(host.isIndeterminate, c.isAnnounced);
        progress(disk, 60);
        EXPECT_FLOAT_EQ(static_cast<float>(host.progress), static_cast<float>(c.after60));
        progress(disk, 60);
        EXPECT_EQ(linesOf(disk).size(), c.isAnnounced ? 3U : 1U);
        EXPECT_EQ(host.count("estimate from 999940 at 50.0"), c.isAnnounced ? 1 : 0);
        finish(disk);
        EXPECT_EQ(linesOf(disk).back(), "Permissions verification complete\n");
        host.journal.clear();
    }
}

TEST_F(OVFXWTest, StatusLineShowsTheEstimate)
{
    const auto disk = addDisk("a");
    const auto whole = addWholeDisk("w");
    verify(disk, whole);
    progress(disk, 10);
    EXPECT_EQ(host.status, "Verifying volume");
    host.estimate = "2 minutes";
    progress(disk, 11);
    EXPECT_EQ(host.status, "Verifying volume. Estimated time: 2 minutes");
    finish(disk);
    progress(whole, 50);
    EXPECT_EQ(host.status, "Verifying partition map for “w”") << "a map's title stays";
}

// Finishing

TEST_F(OVFXWTest, SuccessAndFailureCloseARunDifferently)
{
    const auto good = addDisk("good");
    const auto bad = addDisk("bad");
    bad->mount = "/mnt";
    select(good, bad);
    module->repairDisk(nullptr);
    finish(good);
    finish(bad, kPLErrorDiskInUse);
    EXPECT_EQ(verbosityOf(lastRecord(good)), verbosity::summary);
    EXPECT_NE(verbosityOf(lastRecord(bad)), verbosity::summary);
    EXPECT_EQ(linesOf(bad)[1], "Error: error -19996");
    EXPECT_TRUE(host.has("notify OVDiskChangedNotification good"));
    EXPECT_FALSE(host.has("mount bad with children")) << "it is mounted";
    EXPECT_EQ(std::count(host.activity.begin(), host.activity.end(),
                         "Orvane stopped repairing “bad”: error -19996"),
              1);
}

TEST_F(OVFXWTest, ASummaryCountsItsOwnRunOnly)
{
    const auto disk = addDisk("a");
    select(disk);
    const auto run = [&](const std::vector<Dictionary>& messages) {
        module->repairDisk(nullptr);
        for (const Dictionary& made : messages)
            say(disk, made);
        finish(disk);
        return lastRecord(disk);
    };
    const Dictionary first =
        run({message("VERIFY", "1"), message("VERIFY", "2"), message("REPAIR", "3"),
             message("FAIL", "4"), message("OTHER", "5")});
    EXPECT_EQ(first.integer(kFsckVerify), 2);
    EXPECT_EQ(first.integer(kFsckRepair), 1);
    EXPECT_EQ(first.integer(kFsckFail), 1);
    const Dictionary second =
        run({message("VERIFY", "1"), message("ERROR", "2"), message("REPAIR", "3")});
    EXPECT_EQ(second.integer(kFsckVerify), 0) << "an error is a heading and ends the count";
    EXPECT_EQ(second.integer(kFsckError), 0);
    EXPECT_EQ(second.integer(kFsckRepair), 1);
}

}  // namespace fixwell
