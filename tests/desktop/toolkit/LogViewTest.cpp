// SPDX-License-Identifier: Apache-2.0
#include "tests/desktop/toolkit/ToolkitFixture.h"

#include <QClipboard>
#include <QKeyEvent>
#include <QLabel>
#include <QMimeData>

namespace orvane::desktop {
namespace {

using LogView = ToolkitTest;

void press(QWidget& widget, int key, Qt::KeyboardModifiers modifiers = Qt::NoModifier)
{
    QKeyEvent event(QEvent::KeyPress, key, modifiers);
    QApplication::sendEvent(&widget, &event);
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
