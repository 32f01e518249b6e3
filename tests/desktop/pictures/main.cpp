// SPDX-License-Identifier: Apache-2.0
// One run takes the pictures of one language and look: the environment says which, and how they
// are called (see `take`).

#include "orvane/desktop/toolkit/ColorScheme.h"
#include "orvane/support/texts/Language.h"
#include "tests/desktop/WindowFixture.h"
#include "tests/support/InterruptedRepair.h"
#include "tests/support/TestDirectory.h"

#include <QApplication>
#include <QLineEdit>
#include <QMenu>
#include <QPainter>
#include <QTabWidget>
#include <QTest>

#include <cstdlib>
#include <filesystem>

namespace orvane::desktop::test {
namespace {

std::string look()
{
    return qEnvironmentVariable("PICTURE", QStringLiteral("light")).toStdString();
}

class Pictures : public WindowFixture {
protected:
    void openInOneSize(const std::vector<std::string>& images)
    {
        open(images);
        window().resize(1180, 600);
        window().splitter().setSizes({420, 760});
    }

    void finishJob()
    {
        ASSERT_TRUE(waitForJob());
        QTest::qWait(100);
        takeSheet();
        QTest::qWait(50);
    }

    void treat(const char* name, const std::string& image)
    {
        select(image);
        button(name).press();
        finishJob();
    }

    /// Keeps a picture of the window with the build.
    void takePicture(const std::string& name)
    {
        QPixmap picture = window().grab();
        QWidget* const above = sheet() != nullptr ? sheet() : QApplication::activePopupWidget();
        if (above != nullptr) {
            const QPoint corner = above->mapToGlobal(QPoint()) - window().mapToGlobal(QPoint());
            QPainter(&picture).drawPixmap(corner, above->grab());
        }
        save(picture, name);
    }

    void takePictureOfMenu(const char* command, const std::string& name)
    {
        auto* const menu = qobject_cast<QMenu*>(this->command(command).parent());
        menu->popup(window().mapToGlobal(QPoint(120, 24)));
        QTest::qWait(50);
        takePicture(name);
        menu->close();
        QTest::qWait(50);
    }

    /// Presses what changes something, of a sheet that asks.
    void accept()
    {
        for (QAbstractButton* button : sheet()->buttons())
            if (sheet()->buttonRole(button) == QMessageBox::DestructiveRole)
                QTest::mouseClick(button, Qt::LeftButton);
    }

    static void save(const QPixmap& picture, const std::string& name)
    {
        std::filesystem::create_directories(SCREENSHOT_DIRECTORY);
        EXPECT_TRUE(picture.save(
            QString::fromStdString(SCREENSHOT_DIRECTORY "/" + look() + name + ".png")));
    }
};

TEST_F(Pictures, OfADamagedDiskThatWasVerified)
{
    const std::string sound = makeImage("Photos");
    const std::string damaged = makeDamagedImage("Letters");
    openInOneSize({sound, damaged});
    takePicture("-empty");
    treat("verifyDiskButton", sound);
    treat("verifyDiskButton", damaged);
    takePicture("");
    session().host().sharedHelpManager().openHelpAnchor("ovhelp11868");
    QTest::qWait(50);
    QWidget& help = *session().host().sharedHelpManager().window();
    save(help.grab(), "-help");
    EXPECT_LE(window().minimumSizeHint().width(), 1180) << "it has room on a small screen";
}

TEST_F(Pictures, OfALogOfSeveralRuns)
{
    const std::string image = makeDamagedImage("Letters");
    openInOneSize({image});
    treat("verifyDiskButton", image);
    treat("repairDiskButton", image);
    treat("verifyDiskButton", image);
    session_.reset();
    openInOneSize({image});
    select(image);
    QTest::qWait(100);
    takePicture("-runs");
    button("showDetailsButton").press();
    QTest::keyClick(&window(), Qt::Key_F, Qt::ControlModifier);
    auto* const field = window().findChild<QLineEdit*>(QStringLiteral("logSearchField"));
    field->setText(QStringLiteral("block"));
    QTest::qWait(100);
    takePicture("-search");
    EXPECT_GT(logRows().size(), 20U) << "a folded run with a match is open";
}

TEST_F(Pictures, OfARepairThatIsUndone)
{
    const std::string image = makeDamagedImage("Letters");
    const std::string interrupted = makeImage("Photos");
    orvane::test::interruptRepair(interrupted, directory_ / "state/repairs/records");
    openInOneSize({image, interrupted});
    takePictureOfMenu("preferences", "-edit-menu");
    takePicture("-interrupted-row");
    select(interrupted);
    QTest::qWait(300);
    takePicture("-interrupted");
    treat("repairDiskButton", image);
    QTest::qWait(300);
    takePictureOfMenu("undoRepair", "-menu");
    command("undoRepair").trigger();
    QTest::qWait(100);
    takePicture("-undo");
    accept();
    QCoreApplication::sendPostedEvents(&window());
    takePicture("-undoing");
    ASSERT_TRUE(waitUntil([&] { return verdict(image) != "" && logRows().size() > 10; }));
    QTest::qWait(300);
    takePicture("-undone");
}

TEST_F(Pictures, OfARepairThatIsNotProven)
{
    const std::string tools = directory_.fakeTools(
        "say Pass 1: Checking inodes, blocks, and sizes\nwrite-in-repair changed\nexit 4");
    ::setenv("FIXWELL_TOOL_PATH", tools.c_str(), 1);
    const std::string image = makeImage("Letters");
    openInOneSize({image});
    select(image);
    button("repairDiskButton").press();
    ASSERT_TRUE(waitForStep(NextStep::ApplyUnproven));
    QTest::qWait(300);
    takePicture("-unproven");
    take(NextStep::ApplyUnproven);
    QTest::qWait(100);
    takePicture("-unproven-confirmation");
}

TEST_F(Pictures, OfTheDialogs)
{
    const std::string image = makeDamagedImage("Letters");
    openInOneSize({image});
    treat("repairDiskButton", image);
    const auto dialog = [this](const char* name) -> QWidget& {
        QTest::qWait(100);
        return *window().findChild<QWidget*>(QLatin1String(name));
    };
    command("preferences").trigger();
    QWidget& preferences = dialog("preferencesDialog");
    auto& pages = *preferences.findChild<QTabWidget*>();
    for (int page = 0; page < pages.count(); ++page) {
        pages.setCurrentIndex(page);
        save(dialog("preferencesDialog").grab(), "-preferences-" + std::to_string(page));
    }
    preferences.close();
    command("about").trigger();
    QTest::qWait(2000);
    save(dialog("aboutDialog").grab(), "-about");
    dialog("aboutDialog").close();
    command("saveReport").trigger();
    save(dialog("reportDialog").grab(), "-report");
    dialog("reportDialog").close();
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
    QApplication::setStyle(new orvane::desktop::FramedStyle);
    if (qEnvironmentVariable("PICTURE").contains(QLatin1String("dark")))
        QApplication::setPalette(orvane::desktop::darkPalette());
    if (const int points = qEnvironmentVariableIntValue("FONT_POINTS"); points > 0) {
        QFont font = QApplication::font();
        font.setPointSize(points);
        QApplication::setFont(font);
    }
    return RUN_ALL_TESTS();
}
