// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/support/texts/Catalogue.h"
#include "orvane/support/texts/Language.h"
#include "tests/desktop/toolkit/ToolkitFixture.h"

#include <QFile>
#include <QScrollArea>
#include <QSplitter>
#include <QTest>
#include <QXmlStreamReader>

#include <clocale>

namespace orvane::desktop {
namespace {

using Interface = ToolkitTest;

TEST_F(Interface, EveryOutletIsFilledAndEveryControlCanBeHeard)
{
    for (const char* name :
         {"verifyDiskButton", "repairDiskButton", "verifyPermissionsButton",
          "repairPermissionsButton", "showDetailsButton", "clearHistoryButton", "helpButton"}) {
        QtButton* const button = interface->button(name);
        ASSERT_NE(button, nullptr) << name;
        EXPECT_FALSE(button->action().empty()) << name;
        EXPECT_FALSE(button->widget().text().isEmpty()) << name;
    }
    EXPECT_EQ(interface->button("clearHistoryButton")->title(), "Verlauf &löschen");
    auto* const instructions =
        interface->widget().findChild<QLabel*>(QStringLiteral("instructionalTextField"));
    EXPECT_TRUE(instructions->text().contains(QStringLiteral("click Verify Disk")));
}

TEST_F(Interface, AClickReachesTheModuleAndAJobTurnsTheButtonIntoStop)
{
    QtButton& verify = *interface->button("verifyDiskButton");
    const QKeySequence shortcut = verify.widget().shortcut();
    ASSERT_TRUE(verify.isEnabled()) << verify.toolTip();
    verify.press();
    settle();
    EXPECT_EQ(verify.title(), "Stop Verify");
    EXPECT_EQ(verify.action(), "stopAction:");
    EXPECT_EQ(verify.widget().shortcut(), shortcut) << "the key stays with the button";
    EXPECT_TRUE(host.fake.isLocked);
}

TEST_F(Interface, DividerStandsBetweenTheLimitsOfTheModule)
{
    auto& splitter = *interface->widget().findChild<QSplitter*>();
    for (const int wanted : {0, 150, 1000}) {
        splitter.setSizes({wanted, splitter.height() - wanted});
        settle();
        EXPECT_GE(splitter.widget(0)->height(), 80);
        EXPECT_LE(splitter.widget(0)->height(), 210);
    }
}

TEST_F(Interface, InstructionsHaveJustTheRoomTheyNeedUntilTheUserMovesTheDivider)
{
    auto& splitter = *interface->widget().findChild<QSplitter*>();
    auto& scroll = *interface->widget().findChild<QScrollArea*>();
    for (const int width : {640, 420, 900}) {
        interface->widget().resize(width, 560);
        settle();
        const int wanted = scroll.widget()->heightForWidth(scroll.viewport()->width());
        EXPECT_EQ(splitter.widget(0)->height(), qBound(80, wanted, 210)) << width;
    }
    splitter.setSizes({160, splitter.height() - 160});
    emit splitter.splitterMoved(160, 1);
    const int moved = splitter.widget(0)->height();
    interface->widget().resize(640, 560);
    settle();
    EXPECT_EQ(splitter.widget(0)->height(), moved);
}

TEST_F(Interface, AnEmptyLogSaysWhatToDo)
{
    const auto* const note = table().viewport()->findChild<QLabel*>();
    ASSERT_NE(note, nullptr);
    EXPECT_TRUE(note->isVisible());
    EXPECT_EQ(note->geometry(), table().viewport()->rect());
    addRow("one");
    reload();
    EXPECT_FALSE(note->isVisible());
    disk->history = contract::Array::make();
    selectDisk();
    reload();
    EXPECT_TRUE(note->isVisible());
}

TEST_F(Interface, EveryTextOfTheFileHasAGermanOne)
{
    QFile file(QStringLiteral(FXW_UI));
    ASSERT_TRUE(file.open(QIODevice::ReadOnly));
    std::setlocale(LC_ALL, "C.UTF-8");
    std::setlocale(LC_NUMERIC, "C");
    setLanguage("de");
    const ModuleBundle bundle(MODULE_BUNDLE, "FXW");
    int texts = 0;
    for (QXmlStreamReader reader(&file); !reader.atEnd(); reader.readNext()) {
        if (!reader.isStartElement() || reader.name() != QLatin1String("string") ||
            reader.attributes().hasAttribute(QStringLiteral("notr")))
            continue;
        const std::string text = fromQt(reader.readElementText());
        EXPECT_TRUE(bundle.catalogue().find("FXW", text)) << text;
        ++texts;
    }
    EXPECT_GE(texts, 15);
    setLanguage("");
}

TEST_F(Interface, NothingIsSentToAModuleThatHasGone)
{
    addRow("one");
    reload();
    view->reloadData();
    module.reset();
    settle();
    EXPECT_EQ(interface->outlineView(), nullptr);
    EXPECT_EQ(table().model()->rowCount(), 0);
    interface->button("showDetailsButton")->press();
    interface->widget().grab();
}

TEST_F(Interface, LooksAsItShouldInLightAndDark)
{
    using contract::Color;
    const Color red{1, 0, 0, 1};
    const Color green{0, 0.8, 0.2, 1};
    addRow("Verifying volume “USB”", -1);
    addRow("Checking file system on /dev/loop0");
    addRow("Inode 12, i_blocks is 24, should be 8. This line is long: " + std::string(200, 'x') +
               " and this is its end.",
           0, {{}, red, {}});
    addRow("The volume “USB” appears to be OK.", -1, {contract::Font::boldSystem(11), green, {}});
    reload();
    table().selectRow(1);
    const QPalette before = QApplication::palette();
    EXPECT_TRUE(interface->widget().grab().save(QStringLiteral(SCREENSHOTS "/light.png")));
    QPalette dark(QColor(0x35, 0x35, 0x35), QColor(0x2b, 0x2b, 0x2b));
    dark.setColor(QPalette::Base, QColor(0x1e, 0x1e, 0x1e));
    QApplication::setPalette(dark);
    settle();
    EXPECT_TRUE(interface->widget().grab().save(QStringLiteral(SCREENSHOTS "/dark.png")));
    QApplication::setPalette(before);
}

}  // namespace
}  // namespace orvane::desktop
