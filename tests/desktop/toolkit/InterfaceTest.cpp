// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/QtHelp.h"
#include "tests/desktop/toolkit/ToolkitFixture.h"

#include <QFile>
#include <QScrollBar>
#include <QSplitter>
#include <QTemporaryDir>

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
    EXPECT_EQ(interface->button("clearHistoryButton")->title(), "Verlauf löschen");
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

TEST_F(Interface, HelpOpensAtItsAnchorOrSaysThatThereIsNoBook)
{
    const QTemporaryDir directory;
    const QString book = directory.filePath(QStringLiteral("index.html"));
    QFile file(book);
    ASSERT_TRUE(file.open(QIODevice::WriteOnly));
    file.write("<h1>Book</h1><p>" + QByteArray("line<br/>").repeated(200) +
               "</p><h2><a name=\"ovhelp11868\">Checking</a></h2>" +
               QByteArray("line<br/>").repeated(200));
    file.close();
    const auto window = [] {
        for (QWidget* candidate : QApplication::topLevelWidgets())
            if (auto* const browser = qobject_cast<QTextBrowser*>(candidate))
                return browser;
        return static_cast<QTextBrowser*>(nullptr);
    };
    {
        QtHelp help(book.toStdString(), host.bundle);
        help.openHelpAnchor("ovhelp11868");
        settle();
        ASSERT_NE(window(), nullptr);
        EXPECT_GT(window()->verticalScrollBar()->value(), 0);
        help.openHelpAnchor("");
        settle();
        EXPECT_EQ(window()->verticalScrollBar()->value(), 0);
    }
    EXPECT_EQ(window(), nullptr);
    QtHelp missing("/nonexistent/book.html", host.bundle);
    missing.openHelpAnchor("ovhelp11868");
    EXPECT_EQ(window()->toPlainText(),
              QStringLiteral("The help book /nonexistent/book.html cannot be read."));
}

TEST_F(Interface, LooksAsItShouldInLightAndDark)
{
    using fixwell::Color;
    const Color red{1, 0, 0, 1};
    const Color green{0, 0.8, 0.2, 1};
    addRow("Verifying volume “USB”", -1);
    addRow("Checking file system on /dev/loop0");
    addRow("Inode 12, i_blocks is 24, should be 8. This line is long: " + std::string(200, 'x') +
               " and this is its end.",
           0, {{}, red, {}});
    addRow("The volume “USB” appears to be OK.", -1, {fixwell::Font::boldSystem(11), green, {}});
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
