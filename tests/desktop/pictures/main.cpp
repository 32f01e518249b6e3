// SPDX-License-Identifier: Apache-2.0
// One run takes the pictures of one language and look: the environment says which, and how they
// are called (see `take`).

#include "orvane/desktop/toolkit/ColorScheme.h"
#include "orvane/support/texts/Language.h"
#include "tests/desktop/WindowFixture.h"
#include "tests/support/ToolRun.h"

#include <QApplication>
#include <QTest>
#include <QToolTip>

#include <cstdlib>
#include <filesystem>
#include <fstream>

namespace orvane::desktop::test {
namespace {

std::string look()
{
    return qEnvironmentVariable("PICTURE", QStringLiteral("light")).toStdString();
}

class Pictures : public WindowFixture {
protected:
    // Whatever the language.
    void verify(const std::string& image)
    {
        select(image);
        button("verifyDiskButton").press();
        ASSERT_TRUE(waitUntil([&] {
            return button("verifyDiskButton").action() == "verifyDisk:" &&
                   !cell(image, DiskColumn::Verdict).empty();
        }));
        if (QMessageBox* const box = sheet())
            box->close();
        QTest::qWait(50);
    }
};

TEST_F(Pictures, OfADamagedDiskThatWasVerified)
{
    const std::string sound = makeImage("Photos");
    const std::string damaged = makeDamagedImage("Letters");
    open({sound, damaged});
    window().resize(1180, 600);
    window().splitter().setSizes({420, 760});
    takePicture(look() + "-empty");
    verify(sound);
    verify(damaged);
    takePicture(look());
    session().host().sharedHelpManager().openHelpAnchor("ovhelp11868");
    QTest::qWait(50);
    QWidget& help = *session().host().sharedHelpManager().window();
    EXPECT_TRUE(
        help.grab().save(QString::fromStdString(SCREENSHOT_DIRECTORY "/" + look() + "-help.png")));
    EXPECT_LE(window().minimumSizeHint().width(), 1180) << "it has room on a small screen";
}

// What happens to images and maps, what is in work, and where a button is grey.
TEST_F(Pictures, OfWhatIsOutOfTheOrdinary)
{
    const std::string sound = makeImage("Photos");
    const std::string map = makePartitionedImage("Camera");
    std::fstream(map) << std::string(1024, '\0');
    const std::string gone = makeImage("Letters");
    open({sound, map, gone});
    window().resize(1180, 600);
    window().splitter().setSizes({420, 760});
    verify(sound);
    verify(map);
    std::filesystem::remove(gone);
    select(gone);
    button("verifyDiskButton").press();
    ASSERT_TRUE(waitUntil([&] { return sheet() != nullptr; }));
    QTest::qWait(50);
    takePicture(look() + "-gone");
    sheet()->close();
    select(map);
    command("verifyMap").trigger();
    ASSERT_TRUE(waitUntil([&] { return button("verifyDiskButton").action() == "verifyDisk:"; }));
    QTest::qWait(50);
    if (QMessageBox* const box = sheet())
        box->close();
    QTest::qWait(50);
    takePicture(look() + "-map");
    window().disks().selectAll();
    QTest::qWait(50);
    QWidget& grey = button("repairPermissionsButton").widget();
    QToolTip::showText(window().mapToGlobal(QPoint(300, 300)), grey.toolTip(), &grey);
    QTest::qWait(100);
    for (QWidget* const widget : QApplication::topLevelWidgets())
        if (widget->isVisible() && widget->inherits("QTipLabel"))
            widget->grab().save(
                QString::fromStdString(SCREENSHOT_DIRECTORY "/" + look() + "-grey.png"));
    QToolTip::hideText();
    close();

    useEndlessTool();
    open({sound, map});
    window().resize(1180, 600);
    window().splitter().setSizes({420, 760});
    select(sound);
    button("clearHistoryButton").press();
    command("undoClear").trigger();
    button("verifyDiskButton").press();
    ASSERT_TRUE(waitUntil([&] {
        return session()
                   .host()
                   .historyStore()
                   .runs(session().host().histories().keyOf(
                       session().host().sharedDiskController().diskNamed(sound + "#0")->facts()))
                   .size() == 2;
    }));
    QTest::qWait(300);
    takePicture(look() + "-working");
    button("verifyDiskButton").press();
    ASSERT_TRUE(waitUntil([&] { return button("verifyDiskButton").action() == "verifyDisk:"; }));
    QTest::qWait(100);
    takePicture(look() + "-stopped");
}

TEST_F(Pictures, OfARepairWhoseLogIsLong)
{
    const std::string image = makeImage("Archive");
    for (int inode = 11; inode < 200; ++inode)
        EXPECT_EQ(orvane::test::runTool(
                      {"debugfs", "-w", "-R", "setb " + std::to_string(200 + inode), image}),
                  0);
    EXPECT_EQ(orvane::test::runTool({"debugfs", "-w", "-R", "clri /lost+found", image}), 0);
    open({image});
    window().resize(820, 560);
    verify(image);
    button("showDetailsButton").press();
    button("repairDiskButton").press();
    ASSERT_TRUE(waitUntil([&] { return button("repairDiskButton").action() == "repairDisk:"; }));
    if (QMessageBox* const box = sheet())
        box->close();
    QTest::qWait(100);
    takePicture(look() + "-repaired");
}

}  // namespace
}  // namespace orvane::desktop::test

int main(int argc, char** argv)
{
    ::setenv("LC_ALL", "C.UTF-8", 1);
    orvane::adoptUserLocale();
    testing::InitGoogleTest(&argc, argv);
    QApplication application(argc, argv);
    QLocale::setDefault(QLocale(QString::fromStdString(orvane::currentLanguage())));
    QApplication::setQuitOnLastWindowClosed(false);
    QApplication::setStyle(QStringLiteral("fusion"));
    if (qEnvironmentVariable("PICTURE").contains(QLatin1String("dark")))
        QApplication::setPalette(orvane::desktop::darkPalette());
    if (const int points = qEnvironmentVariableIntValue("FONT_POINTS"); points > 0) {
        QFont font = QApplication::font();
        font.setPointSize(points);
        QApplication::setFont(font);
    }
    return RUN_ALL_TESTS();
}
