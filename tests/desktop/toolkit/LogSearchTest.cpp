// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/LogSearch.h"

#include "tests/desktop/toolkit/ToolkitFixture.h"

#include <QKeyEvent>
#include <QTest>

namespace orvane::desktop {
namespace {

TEST(TextFinder, FindsWhateverTheCase)
{
    struct Case {
        const char* wanted;
        std::string_view text;
        bool isThere;
    };
    for (const Case& c :
         {Case{"inode", "Inode 16, i_blocks is 8", true}, Case{"INODE 1", "an inode 12", true},
          Case{"inode", "ino de", false}, Case{"e", "", false}, Case{"", "anything", false},
          Case{"Überprüft", "ÜBERPRÜFT", true}, Case{"übe", "\xff Über", true},
          Case{"a", "\xff\xfe", false}})
        EXPECT_EQ(TextFinder(QString::fromUtf8(c.wanted)).isIn(c.text), c.isThere)
            << c.wanted << " in " << c.text;
}

class LogSearchTest : public ToolkitTest {
protected:
    LogSearch& search()
    {
        return dynamic_cast<LogSearch&>(
            *interface->widget().findChild<QWidget*>(QStringLiteral("logSearch")));
    }
    void type(const char* text)
    {
        search().open();
        search().field().setText(QString::fromUtf8(text));
        const bool isDone = QTest::qWaitFor(
            [this] { return !search().count().text().endsWith(QStringLiteral("…")); }, 20'000);
        EXPECT_TRUE(isDone);
    }
    void press(int key, Qt::KeyboardModifiers modifiers = Qt::NoModifier)
    {
        QTest::keyClick(&search().field(), static_cast<Qt::Key>(key), modifiers);
    }
    /// The row that was gone to, and which of how many it is.
    std::string place()
    {
        return rowText(table().currentIndex().row()).toStdString() + ", " +
               search().count().text().toStdString();
    }
};

TEST_F(LogSearchTest, GoesFromMatchToMatchAlsoInFoldedRuns)
{
    addRun("first", {"Inode 1", "other"});
    addRun("second", {"other", "inode 2"});
    addRow("a detail", 2);
    selectDisk();
    type("INODE");
    EXPECT_EQ(place(), "Inode 1, 1 of 2") << "its run is unfolded";
    press(Qt::Key_Return);
    EXPECT_EQ(place(), "inode 2, 2 of 2");
    press(Qt::Key_Return);
    EXPECT_EQ(place(), "Inode 1, 1 of 2") << "round and round";
    press(Qt::Key_Return, Qt::ShiftModifier);
    EXPECT_EQ(place(), "inode 2, 2 of 2");
    addRun("third", {"inode 3"});
    reload();
    settle();
    EXPECT_EQ(place(), "inode 2, 2 of 3") << "the log has grown";
    interface->button("showDetailsButton")->press();
    settle();
    settle();
    EXPECT_EQ(place(), "inode 2, 2 of 3") << "the log is another, with the same row";
    type("nothing");
    EXPECT_EQ(search().count().text(), QStringLiteral("Not found"));
    press(Qt::Key_Escape);
    EXPECT_FALSE(search().isVisible());
    EXPECT_TRUE(table().searched().isEmpty()) << "nothing is marked any more";
}

TEST_F(LogSearchTest, AMillionRowsAreLookedThroughInBits)
{
    for (int i = 0; i < 300'000; ++i)
        addRow(i % 100'000 == 7 ? "needle" : "hay");
    selectDisk();
    type("needle");
    EXPECT_EQ(place(), "needle, 1 of 3");
}

}  // namespace
}  // namespace orvane::desktop
