// SPDX-License-Identifier: Apache-2.0
#include "fixwell/messagelog/OVFXWMessageOutlineView.h"
#include "tests/module/ModuleTest.h"

namespace fixwell {
namespace {

Dictionary record(std::int64_t level, std::string_view type = {}, std::string_view text = "line\n")
{
    const Dictionary made = Dictionary::of(
        {{kOV_finalAttributedString_type, StyledText::make(text)}, {kFsckVerbosity, level}});
    if (!type.empty())
        made.set(kFsckMessageType, type);
    return made;
}

Array historyOf(std::initializer_list<std::int64_t> levels)
{
    const Array history = Array::make();
    for (const std::int64_t level : levels)
        history.append(record(level));
    return history;
}

}  // namespace

TEST_F(OVFXWTest, ReloadsAreBatched)
{
    const auto disk = addDisk("a");
    disk->history = Array::make();
    select(disk);
    const int before = host.outlinePeer.reloads;
    const auto reloads = [&] {
        return host.outlinePeer.reloads - before;
    };

    for (int i = 0; i < 48; ++i)
        add(disk->history, record(2), false);
    EXPECT_EQ(reloads(), 0) << "nothing was reloaded yet, so the first 48 wait";
    add(disk->history, record(2), false);
    EXPECT_EQ(reloads(), 1) << "the 49th does not";
    for (int i = 0; i < 30; ++i)
        add(disk->history, record(2), false);
    EXPECT_EQ(reloads(), 1);
    host.clock += std::chrono::milliseconds(200);
    add(disk->history, record(2), false);
    EXPECT_EQ(reloads(), 1) << "exactly 0.2 seconds is still recent";
    host.clock += std::chrono::milliseconds(1);
    add(disk->history, record(2), false);
    EXPECT_EQ(reloads(), 2);
    add(disk->history, record(-1), true);
    add(disk->history, record(-1), true);
    EXPECT_EQ(reloads(), 4) << "a forced record always reloads";
}

TEST_F(OVFXWTest, TheNewestLineStaysInSightUnlessTheUserReads)
{
    struct Case {
        std::size_t rows;
        double scroller;
        bool scrolls;
    };
    for (const Case& c :
         {Case{49, 0.5, true}, Case{60, 0.5, false}, Case{60, 0.96, false}, Case{60, 0.97, true}}) {
        const auto disk = addDisk("d" + std::to_string(host.disks.size()));
        disk->history = Array::make();
        for (std::size_t i = 1; i < c.rows; ++i)
            disk->history.append(record(0));
        select(disk);
        host.outlinePeer.scrolledTo.clear();
        host.outlinePeer.scroller.position = c.scroller;
        add(disk->history, record(0), true);
        EXPECT_EQ(host.outlinePeer.scrolledTo,
                  c.scrolls ? std::vector<std::size_t>{c.rows - 1} : std::vector<std::size_t>{})
            << c.rows << " rows, scroller at " << c.scroller;
    }
}

TEST_F(OVFXWTest, AReadOnlyRootKeepsHeadingsAndDropsDetails)
{
    host.rootIsReadOnly = true;
    makeModule();
    const Array history = Array::make();
    for (int i = 0; i < 1000; ++i)
        history.append(record(2));
    add(history, record(2), false);
    EXPECT_EQ(history.size(), 1001U);
    const std::size_t logged = host.activity.size();
    add(history, record(1), false);
    EXPECT_EQ(history.size(), 1001U);
    EXPECT_EQ(host.activity.size(), logged) << "a dropped record is not logged either";
    add(history, record(0), false);
    EXPECT_EQ(history.size(), 1002U);
}

TEST_F(OVFXWTest, RowsFollowTheShowDetailsSwitch)
{
    struct Case {
        Array history;
        std::size_t brief;
        std::size_t detailed;
        std::string_view because;
    };
    for (const Case& c :
         {Case{historyOf({-1, 0, 2, 1, 0, -2}), 3, 5, "the closing summary is hidden"},
          Case{historyOf({-1, -2, 1}), 2, 3, "an earlier summary is a row"},
          Case{historyOf({-2}), 0, 0, "nothing but a summary"},
          Case{{}, 0, 0, "no history at all"}}) {
        const auto disk = addDisk("d" + std::to_string(host.disks.size()));
        disk->history = c.history;
        select(disk);
        EXPECT_EQ(host.outlinePeer.rows, c.brief) << c.because;
        EXPECT_EQ(module->canPrint(), c.history.size() > 0);
        module->showDetailsAction(nullptr);
        EXPECT_TRUE(host.showsDetails);
        EXPECT_EQ(host.outlinePeer.rows, c.detailed) << c.because;
        module->showDetailsAction(nullptr);
        for (std::size_t row = 0; row < c.brief; ++row)
            EXPECT_LT(verbosityOf(module->outlineViewChildOfItem(row, {})), 1);
    }
}

TEST_F(OVFXWTest, RowsKeepUpWithAHistoryThatGrowsAndIsCleared)
{
    const auto disk = addDisk("a");
    disk->history = historyOf({-1, 2, 0});
    select(disk);
    EXPECT_EQ(host.outlinePeer.rows, 2U);
    disk->history.append(record(0, {}, "new\n"));
    host.outlineView->reloadData();
    ASSERT_EQ(host.outlinePeer.rows, 3U);
    EXPECT_EQ(finalText(module->outlineViewChildOfItem(2, {})).characters(), "new\n");
    module->clearHistoryAction(nullptr);
    EXPECT_EQ(host.outlinePeer.rows, 0U);
    EXPECT_FALSE(module->outlineViewChildOfItem(0, {}));
    disk->history.append(record(0, {}, "again\n"));
    host.outlineView->reloadData();
    EXPECT_EQ(finalText(module->outlineViewChildOfItem(0, {})).characters(), "again\n");
}

// The rows of a disk stand in the selection's order, also while a disk in front still grows.
TEST_F(OVFXWTest, RowsKeepUpWithSeveralHistories)
{
    const auto first = addDisk("a");
    const auto second = addDisk("b");
    first->history = historyOf({0, 2});
    second->history = historyOf({-1, 2, -2});
    select(first, second);
    EXPECT_EQ(host.outlinePeer.rows, 2U) << "the summary at the very end is no row";
    first->history.append(record(0, {}, "new\n"));
    first->history.append(record(-2, {}, "summary\n"));
    host.outlineView->reloadData();
    EXPECT_EQ(host.outlinePeer.rows, 4U) << "one in the middle is";
    EXPECT_EQ(finalText(module->outlineViewChildOfItem(1, {})).characters(), "new\n");
    EXPECT_EQ(verbosityOf(module->outlineViewChildOfItem(3, {})), -1);
    second->history = historyOf({0});
    host.outlineView->reloadData();
    EXPECT_EQ(host.outlinePeer.rows, 4U);
    EXPECT_EQ(verbosityOf(module->outlineViewChildOfItem(3, {})), 0) << "another list";
}

TEST_F(OVFXWTest, OnlyAFullSelectionCanBeDeleted)
{
    const auto disk = addDisk("a");
    auto& view = static_cast<OVFXWMessageOutlineView&>(*host.outlineView);
    struct Case {
        std::vector<std::size_t> selected;
        bool copies;
        bool deletes;
    };
    for (const Case& c :
         {Case{{}, false, false}, Case{{1}, true, false}, Case{{0, 1}, true, true}}) {
        disk->history = historyOf({-1, 0});
        select(disk);
        host.outlinePeer.selected = c.selected;
        EXPECT_EQ(view.validateMenuItem({"copy:"}), c.copies);
        EXPECT_EQ(view.validateMenuItem({"delete:"}), c.deletes);
        EXPECT_TRUE(view.validateMenuItem({"selectAll:"}));
        EXPECT_FALSE(view.validateMenuItem({"paste:"}));
        for (const std::uint16_t key : {keyDelete, keyForwardDelete, keyKeypadClear}) {
            disk->history = historyOf({-1, 0});
            host.outlineView->reloadData();
            host.outlinePeer.baseKeys = 0;
            view.keyDown({key, 0, nullptr});
            EXPECT_EQ(disk->history.isEmpty(), c.deletes);
            EXPECT_EQ(host.outlinePeer.baseKeys, c.deletes ? 0 : 1);
        }
    }
    disk->history = historyOf({0});
    view.reloadData();
    host.outlinePeer.selected = {0};
    view.keyDown({36, 0, nullptr});
    EXPECT_FALSE(disk->history.isEmpty()) << "any other key is the view's own";
    view.delete_(nullptr);
    EXPECT_TRUE(disk->history.isEmpty());
}

TEST_F(OVFXWTest, CopiesAndDragsCarryTheLogInFourTypes)
{
    const auto disk = addDisk("a");
    disk->history = Array::of({record(0, "", "first {é}\n"), record(0), record(-1, "", "last\n")});
    select(disk);
    host.outlinePeer.selected = {0, 2};
    host.outlineView->copy(nullptr);
    using enum PasteboardType;
    EXPECT_EQ(host.declared, (std::vector{PlainString, TabularText, RTF, RTFD}));
    EXPECT_EQ(host.pasted[PlainString], "first {é}\nlast\n");
    EXPECT_EQ(host.pasted[TabularText], host.pasted[PlainString]);

    host.declared.clear();
    EXPECT_FALSE(module->outlineViewWriteItemsToPasteboard({}, host));
    EXPECT_FALSE(module->outlineViewWriteItemsToPasteboard({Dictionary::make()}, host));
    EXPECT_TRUE(host.declared.empty()) << "a drag without text writes nothing";
    EXPECT_TRUE(module->outlineViewWriteItemsToPasteboard(
        {module->outlineViewChildOfItem(2, {}), module->outlineViewChildOfItem(0, {})}, host));
    EXPECT_EQ(host.pasted[PlainString], "last\nfirst {é}\n") << "in the order given";
}

TEST_F(OVFXWTest, CellsAreCutInTheMiddleAndUnknownRowsAreHarmless)
{
    OVFXWBrowserCell cell;
    module->outlineViewWillDisplayCellForTableColumnItem(cell, record(0));
    EXPECT_EQ(cell.attributedStringValue().style().paragraph->lineBreak, LineBreak::TruncateMiddle);
    module->outlineViewWillDisplayCellForTableColumnItem(cell, Dictionary::make());
    EXPECT_EQ(cell.attributedStringValue().characters(), " ");
    static_cast<OVFXWMessageOutlineView&>(*host.outlineView).reloadRow(99);
    EXPECT_TRUE(host.outlinePeer.redrawn.empty()) << "no such row, nothing to redraw";
}

// Histories of a selection

TEST_F(OVFXWTest, HistoriesOfSeveralDisksAreJoinedOnce)
{
    const auto whole = addDisk("disk");
    const auto volume = addDisk("disk1");
    whole->volumes = {volume};
    volume->parent = whole;
    whole->history = historyOf({0});
    volume->history = historyOf({0, 0});
    const auto size = [&](auto... disks) {
        select(disks...);
        return historyOfSelection().size();
    };
    EXPECT_EQ(size(whole), 3U);
    EXPECT_EQ(size(whole, volume), 3U) << "the volume's are the whole disk's already";
    EXPECT_EQ(size(volume, whole), 5U) << "a volume listed first is shown twice";
    whole->history = {};
    volume->history = {};
    select(whole, volume);
    EXPECT_FALSE(historyOfSelection()) << "nothing to clear";
    EXPECT_FALSE(button("clearHistoryButton").enabled);
}

TEST_F(OVFXWTest, ClearingTellsTheHostOnlyWhatWasCleared)
{
    const auto full = addDisk("full");
    const auto empty = addDisk("empty");
    full->history = historyOf({0});
    select(full, empty);
    EXPECT_TRUE(button("clearHistoryButton").enabled);
    module->clearHistoryAction(nullptr);
    EXPECT_TRUE(host.has("notify OVDiskChangedNotification full"));
    EXPECT_FALSE(host.has("notify OVDiskChangedNotification empty"));
}

}  // namespace fixwell
