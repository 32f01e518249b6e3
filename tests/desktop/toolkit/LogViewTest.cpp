// SPDX-License-Identifier: Apache-2.0
#include "tests/desktop/toolkit/ToolkitFixture.h"

#include <QClipboard>
#include <QKeyEvent>
#include <QLabel>
#include <QMimeData>
#include <QTest>

namespace orvane::desktop {
namespace {

using LogView = ToolkitTest;

void press(QWidget& widget, int key, Qt::KeyboardModifiers modifiers = Qt::NoModifier)
{
    QKeyEvent event(QEvent::KeyPress, key, modifiers);
    QApplication::sendEvent(&widget, &event);
}

bool waitFor(const std::function<bool()>& condition)
{
    return QTest::qWaitFor(condition, 20'000);
}

TEST_F(LogView, RowsAreCountedAtOnceAndShownTogetherAfterTheyAreSaved)
{
    const auto* const note = table().viewport()->findChild<QLabel*>();
    EXPECT_TRUE(note->isVisible()) << "an empty log says what to do";
    addRow("Verifying volume “USB”", -1);
    addRow("detail", 2);
    const int before = host.savesBeforeRows;
    for (int i = 0; i < 3; ++i)
        view->reloadData();
    EXPECT_EQ(view->numberOfRows(), 1U) << "details are off";
    EXPECT_EQ(table().model()->rowCount(), 0) << "not shown before the loop comes to it";
    settle();
    EXPECT_EQ(host.savesBeforeRows, before + 1);
    EXPECT_EQ(rowText(0), QStringLiteral("Verifying volume “USB”"));
    EXPECT_FALSE(note->isVisible());
    interface->button("showDetailsButton")->press();
    settle();
    EXPECT_EQ(rowText(1), QStringLiteral("detail"));
}

// Records go on coming between the moment at which the module asks for the last row and the one at
// which the loop comes to it.
TEST_F(LogView, WhoReadsAtTheEndIsShownEveryNewEnd)
{
    for (int i = 0; i < 200; ++i)
        addRow("row " + std::to_string(i));
    selectDisk();
    EXPECT_EQ(view->verticalScroller()->value(), 1.0) << "a log opens at its end";
    for (const int burst : {1, 40, 1000}) {
        view->reloadData();
        view->scrollRowToVisible(view->numberOfRows() - 1);
        for (int i = 0; i < burst; ++i)
            addRow("more");
        settle();
        EXPECT_EQ(view->verticalScroller()->value(), 1.0) << burst;
    }
}

TEST_F(LogView, WhoHasScrolledUpKeepsPlaceAndSelection)
{
    const auto other = std::make_shared<fixwell::testing::FakeDisk>("loop1");
    other->history = contract::Array::make();
    for (int i = 0; i < 200; ++i) {
        addRow("one " + std::to_string(i), i % 4 == 0 ? 0 : 1);
        std::swap(disk->history, other->history);
        addRow("two " + std::to_string(i), i % 4 == 0 ? 0 : 1);
        std::swap(disk->history, other->history);
    }
    host.disks.push_back(other);
    host.selection = {disk, other};
    interface->button("showDetailsButton")->press();
    selectDisk();
    const auto rowOf = [this](const QString& text) {
        int row = 0;
        while (row < table().model()->rowCount() && rowText(row) != text)
            ++row;
        return row;
    };
    const auto growOther = [&] {
        other->history.append(disk->history.back());
    };
    const std::vector<std::function<void()>> changes{
        [this] { addRow("more"); }, growOther,
        [&] {
            addRow("more");
            growOther();
        },
        [this] {
            interface->button("showDetailsButton")->press();
        }};
    for (const char* const name : {"one 100", "two 100"}) {
        const QString line = QString::fromLatin1(name);
        table().selectRow(rowOf(line));
        table().scrollTo(table().currentIndex(), QAbstractItemView::PositionAtCenter);
        const int top = table().rowViewportPosition(rowOf(line));
        for (const std::size_t i : {0U, 1U, 2U, 3U, 3U}) {  // details off and on again
            changes[i]();
            reload();
            const auto row = static_cast<std::size_t>(rowOf(line));
            EXPECT_EQ(view->selectedRowIndexes(), std::vector{row}) << name << i;
            EXPECT_EQ(table().rowViewportPosition(rowOf(line)), top) << name << i;
        }
    }
}

TEST_F(LogView, OlderRunsAreFoldedAndTheModuleCountsTheirRowsAllTheSame)
{
    addRun("first", {"a", "b"});
    addRun("second", {"c"});
    selectDisk();
    EXPECT_EQ(shownRows(), "first|second|c");
    EXPECT_EQ(view->numberOfRows(), 6U) << "with the end of the first, which is a row";
    EXPECT_EQ(view->rectOfRow(2), contract::Rect());
    EXPECT_EQ(view->rectOfRow(4).y, table().rowViewportPosition(1));

    table().selectRow(1);
    EXPECT_EQ(view->selectedRowIndexes(), std::vector<std::size_t>{4});
    press(table(), Qt::Key_Delete);
    EXPECT_FALSE(disk->history.isEmpty()) << "a heading is not all rows";
    press(table(), Qt::Key_A, Qt::ControlModifier);
    EXPECT_EQ(view->selectedRowIndexes(), (std::vector<std::size_t>{0, 1, 2, 3, 4, 5}))
        << "the folded ones as well";

    table().setCurrentIndex(table().model()->index(0, 0));
    press(table(), Qt::Key_Right);
    EXPECT_EQ(shownRows(), "first|a|b|second|c");
    addRun("third", {"d"});
    reload();
    EXPECT_EQ(shownRows(), "first|a|b|second|c|third|d") << "nothing is folded while it is read";
    press(table(), Qt::Key_Down);
    press(table(), Qt::Key_Left);
    EXPECT_EQ(table().currentIndex().row(), 0) << "to the heading";
    for (const int key : {Qt::Key_Left, Qt::Key_Space, Qt::Key_Return}) {
        const bool wasOpen = rowText(1) == "a";
        press(table(), key);
        EXPECT_EQ(rowText(1) == "a", !wasOpen) << key;
    }
    interface->button("showDetailsButton")->press();
    settle();
    EXPECT_EQ(shownRows(), "first|second|c|third|d") << "as the user left it";

    const QRect heading = table().visualRect(table().model()->index(0, 0));
    QTest::mouseClick(table().viewport(), Qt::LeftButton, {}, heading.center());
    EXPECT_EQ(rowText(1), QStringLiteral("a"));
    const auto spoken = [this](int row) {
        return table().model()->index(row, 0).data(Qt::AccessibleTextRole).toString();
    };
    EXPECT_EQ(spoken(0), QStringLiteral("first, expanded"));
}

TEST_F(LogView, HeadingsSayWhatIsKnownOfTheirRuns)
{
    const auto other = std::make_shared<fixwell::testing::FakeDisk>("loop1");
    other->history = contract::Array::make();
    addRun("one", {"a"});
    addRun("two", {"b"});
    addRun("three", {"c"}, other);
    interface->outlinePeer()->setRunKnowledge(
        {[](const contract::OutlineItem& start) {
             const auto text = start[fixwell::kOV_finalAttributedString_type].styledText();
             return text.characters() == "two\n" ? RunNote{"today", "sound", {}} : RunNote();
         },
         [&](const contract::OutlineItem& start) {
             return start.isSameAs(disk->history.at(3).dictionary()) ||
                    start.isSameAs(other->history.at(0).dictionary());
         }});
    host.disks.push_back(other);
    host.selection = {disk, other};
    selectDisk();
    EXPECT_EQ(shownRows(), "one|two|b|three|c") << "the newest of each disk is open";
    EXPECT_GT(table().rowHeight(1), table().rowHeight(0)) << "there is more to say of it";
    EXPECT_EQ(table().model()->index(1, 0).data(Qt::AccessibleTextRole).toString(),
              QStringLiteral("two, today, sound, expanded"));
    view->selectAll(nullptr);
    EXPECT_EQ(interface->outlinePeer()->selectionText(),
              "one\na\n\ntwo (today, sound)\nb\n\nthree\nc\n");
    EXPECT_NE(interface->outlinePeer()->selectionHTML().find("two (today, sound)"),
              std::string::npos);
}

TEST_F(LogView, NothingButProblemsAndHeadingsIsShownOnWish)
{
    addRun("first", {"problem 1"});
    addRun("second", {"fine", "problem 2", "fine"});
    selectDisk();
    interface->outlinePeer()->setFilter(LogRuns::Filter::KeptRows);
    EXPECT_EQ(shownRows(), "first|second|problem 2");
    addRun("third", {"fine", "problem 3"});
    reload();
    EXPECT_EQ(shownRows(), "first|second|problem 2|third|problem 3");
    press(table(), Qt::Key_A, Qt::ControlModifier);
    EXPECT_EQ(view->numberOfSelectedRows(), 5U) << "what is not shown is not deleted with it";
    interface->outlinePeer()->setFilter(LogRuns::Filter::None);
    EXPECT_EQ(shownRows(), "first|second|fine|problem 2|fine|third|fine|problem 3");
}

// Of which the first looks at a part only.
TEST_F(LogView, ALongLogIsFoldedBitByBit)
{
    for (int run = 0; run < 200; ++run)
        addRun("run", std::vector<std::string>(4000, "line"));
    selectDisk();
    ASSERT_TRUE(waitFor([this] { return table().model()->rowCount() == 200 + 4000; }))
        << table().model()->rowCount();
    EXPECT_EQ(view->verticalScroller()->value(), 1.0);
}

TEST_F(LogView, AMillionRowsCostNoMoreThanTheOnesInSight)
{
    for (int i = 0; i < 1'000'000; ++i)
        disk->history.append(contract::Dictionary::of(
            {{fixwell::kOV_finalAttributedString_type, contract::StyledText::make("line\n")}}));
    reload();
    view->selectAll(nullptr);
    EXPECT_EQ(view->numberOfSelectedRows(), 1'000'000U);
    view->scrollRowToVisible(999'999);
    settle();
    EXPECT_EQ(view->verticalScroller()->value(), 1.0);
    for (int i = 0; i < 50; ++i) {
        addRow("more");
        reload();
    }
    EXPECT_EQ(view->numberOfRows(), 1'000'050U);
    EXPECT_EQ(view->numberOfSelectedRows(), 1'000'000U);
}

TEST_F(LogView, DeletingKeysClearTheHistoryOnlyWhenEverythingIsSelected)
{
    for (const int key : {Qt::Key_Backspace, Qt::Key_Delete, Qt::Key_Clear}) {
        disk->history = contract::Array::make();
        addRow("one");
        addRow("two");
        selectDisk();
        table().selectRow(0);
        press(table(), key);
        EXPECT_EQ(disk->history.size(), 2U) << "one row alone is never deleted: key " << key;
        press(table(), Qt::Key_A, Qt::ControlModifier);
        press(table(), key);
        EXPECT_TRUE(disk->history.isEmpty()) << "key " << key;
    }
}

TEST_F(LogView, CopiedRowsGoToTheClipboardInEveryFormat)
{
    addRow("<one> \x1b]0;title\x07{\\rtf \xE2\x80\xAE", -1);
    addRow("two");
    reload();
    host.qtPasteboard.setHTMLSource([this] { return interface->outlinePeer()->selectionHTML(); });
    view->selectAll(nullptr);
    press(table(), Qt::Key_C, Qt::ControlModifier);
    const QMimeData* const data = QGuiApplication::clipboard()->mimeData();
    EXPECT_EQ(data->text(), QStringLiteral("<one> \uFFFD]0;title\uFFFD{\\rtf \uFFFD\ntwo\n"));
    EXPECT_EQ(QString::fromUtf8(data->data("text/tab-separated-values")), data->text());
    EXPECT_TRUE(data->data("text/rtf").startsWith("{\\rtf1"));
    EXPECT_EQ(data->data("application/x-rtfd"), data->data("text/rtf"));
    EXPECT_TRUE(data->html().contains(QStringLiteral("&lt;one&gt;")));
}

}  // namespace
}  // namespace orvane::desktop
