// SPDX-License-Identifier: Apache-2.0
// What the menus do with disks and images.

#include "orvane/desktop/RecentImages.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/support/texts/Language.h"
#include "tests/desktop/WindowFixture.h"
#include "tests/desktop/session/FakeServices.h"
#include "tests/desktop/session/PrivateBus.h"

#include <QApplication>
#include <QClipboard>
#include <QMenu>
#include <QMenuBar>
#include <QMimeData>
#include <QPushButton>
#include <QTest>
#include <QTextEdit>

#include <filesystem>
#include <set>

namespace orvane::desktop::test {
namespace {

class DiskMenuTest : public WindowFixture {
protected:
    /// The command's tool tip as its menu shows it, once that is open; empty for one that is not
    /// grey.
    std::string whyGrey(const char* name)
    {
        for (QObject* owner : command(name).associatedObjects())
            if (auto* const menu = qobject_cast<QMenu*>(owner))
                emit menu->aboutToShow();
        return command(name).isEnabled() ? "" : fromQt(command(name).toolTip());
    }
    /// What stands in File, Open Recent, without the command at the end.
    std::vector<std::string> recent()
    {
        QMenu& menu = *command("openRecent").menu();
        emit menu.aboutToShow();
        std::vector<std::string> titles;
        for (const QAction* entry : menu.actions())
            if (!entry->isSeparator() && entry->objectName() != QLatin1String("clearRecent"))
                titles.push_back(fromQt(entry->text()));
        return titles;
    }
    void chooseRecent(int place) { command("openRecent").menu()->actions().at(place)->trigger(); }
    int rows() { return window().disks().model()->rowCount(); }
};

TEST_F(DiskMenuTest, EveryEntryHasALetterOfItsOwnInEveryLanguage)
{
    for (const char* const language : {"", "de", "es", "fr", "ja"}) {
        setLanguage(language);
        open({});
        const auto check = [&](const QList<QAction*>& entries, const QString& menu) {
            std::set<QString> letters;
            for (const QAction* entry : entries) {
                if (entry->isSeparator())
                    continue;
                const QString letter = QKeySequence::mnemonic(entry->text()).toString();
                EXPECT_FALSE(letter.isEmpty()) << fromQt(menu + entry->text());
                EXPECT_TRUE(letters.insert(letter).second) << fromQt(menu + entry->text());
            }
        };
        check(window().menuBar()->actions(), {});
        for (const QAction* menu : window().menuBar()->actions())
            check(menu->menu()->actions(), menu->text() + QStringLiteral(" > "));
        close();
    }
    setLanguage("");
}

TEST_F(DiskMenuTest, ClosingTakesAnImageFromTheListAndLeavesTheFile)
{
    const std::string image = makePartitionedImage("disk");
    const std::string other = makeImage("other");
    open({image, other});
    window().disks().clearSelection();
    EXPECT_NE(whyGrey("closeImage").find("Select a disk image first."), std::string::npos);
    select(image + "#1");
    EXPECT_EQ(whyGrey("closeImage"), "") << "the image that the volume lies in";
    command("closeImage").trigger();
    EXPECT_FALSE(row(image).isValid());
    EXPECT_TRUE(row(other).isValid());
    EXPECT_TRUE(std::filesystem::exists(image));
    EXPECT_EQ(session().host().sharedDiskController().roots().size(), 2U)
        << "nothing is left of it";
}

TEST_F(DiskMenuTest, ImagesAreOfferedAgainUntilTheyHaveGone)
{
    const std::string one = makeImage("one");
    const std::string two = makeImage("two & a half");
    open({one, two});
    EXPECT_TRUE(recent().empty()) << "what is open need not be opened";
    EXPECT_NE(whyGrey("openRecent"), "");
    close();
    open({});
    EXPECT_EQ(recent(), (std::vector<std::string>{"&1 two && a half.img", "&2 one.img"}));
    std::filesystem::remove(two);
    chooseRecent(0);
    EXPECT_NE(takeSheet().find("two & a half.img” is not there any more"), std::string::npos);
    EXPECT_EQ(recent(), std::vector<std::string>{"&1 one.img"});
    chooseRecent(0);
    EXPECT_TRUE(waitUntil([&] { return row(one).isValid(); }));
    select(one);
    command("closeImage").trigger();
    EXPECT_EQ(recent(), std::vector<std::string>{"&1 one.img"});
    command("openRecent").menu()->findChild<QAction*>(QStringLiteral("clearRecent"))->trigger();
    EXPECT_TRUE(recent().empty());
}

TEST_F(DiskMenuTest, WhatWasOpenComesBackWhereTheUserWantsIt)
{
    const std::string one = makeImage("one");
    const std::string two = makeImage("two");
    const std::string closed = makeImage("closed");
    open({one, two, closed});
    select(closed);
    command("closeImage").trigger();
    close();
    open({});
    EXPECT_EQ(rows(), 0) << "unless it was asked for";
    close();

    open({one, two});
    reopensImages.set(session().host().standardUserDefaults(), true);
    close();
    std::filesystem::remove(two);
    openWith(options({closed}));
    ASSERT_TRUE(waitUntil([&] { return rows() == 2 && sheet() != nullptr; }));
    EXPECT_TRUE(row(one).isValid());
    EXPECT_NE(takeSheet().find("two.img"), std::string::npos) << "what has gone is said";
    ASSERT_EQ(window().disks().selectedDisks().size(), 1U);
    EXPECT_EQ(window().disks().selectedDisks().front()->diskIdentifier(), closed)
        << "what was named is what the user wants";
    close();
    openWith(options({}));
    ASSERT_TRUE(waitUntil([&] { return rows() == 2; }));
    EXPECT_EQ(takeSheet(), "") << "once";
    EXPECT_TRUE(window().disks().selectedDisks().empty()) << "nothing was chosen yet";
}

TEST(RecentImages, KeepsTheNewestTenOfAnyName)
{
    const orvane::test::TestDirectory directory;
    const auto settings = [&] {
        return SettingsFile(directory / "settings.json", [](const std::string&) {});
    };
    const std::string hostile = "/tmp/\xff\n\"<b>.img";
    {
        SettingsFile file = settings();
        RecentImages images(file);
        for (int i = 0; i < 12; ++i)
            images.add("/" + std::to_string(i));
        images.add(hostile);
        images.add("/7");
    }
    SettingsFile file = settings();
    RecentImages images(file);
    EXPECT_EQ(images.files(), (std::vector<std::string>{"/7", hostile, "/11", "/10", "/9", "/8",
                                                        "/6", "/5", "/4", "/3"}));
    file.setObjectForKey("no list", "recentImages");
    EXPECT_TRUE(images.files().empty());
}

TEST_F(DiskMenuTest, AGreyCommandSaysWhy)
{
    openImage("image");
    for (const auto& [name, reason] :
         {std::pair("mount", "it is an image file, which has to be attached"),
          std::pair("eject", "It is an image file; close it instead."),
          std::pair("verifyMap", "It has no partition map"), std::pair("stopJob", "No job runs.")})
        EXPECT_NE(whyGrey(name).find(reason), std::string::npos) << name << whyGrey(name);
    EXPECT_EQ(whyGrey("attachSelected"), "");
    window().disks().clearSelection();
    for (const char* const name :
         {"mount", "unmount", "eject", "attachSelected", "showInFiles", "copyReport", "properties"})
        EXPECT_NE(whyGrey(name), "") << name;
}

TEST_F(DiskMenuTest, AnImageIsShownByTheFileManagerOrItsDirectoryIsOpened)
{
    PrivateBus bus;
    if (!bus.isRunning())
        GTEST_SKIP() << "there is no dbus-daemon";
    const std::string image = makeImage("a b%");
    QList<QUrl> opened;
    bool canOpen = true;
    SessionOptions wanted = options({image});
    wanted.buses.session = bus.lookup("session");
    wanted.openDirectory = [&](const QUrl& directory) {
        opened.push_back(directory);
        return canOpen;
    };
    openWith(std::move(wanted));
    ASSERT_TRUE(waitUntil([&] { return row(image).isValid(); }));
    select(image);
    {
        FakeFileManager files(bus.connection("files"));
        command("showInFiles").trigger();
        ASSERT_TRUE(waitUntil([&] { return !files.items.isEmpty(); }));
        EXPECT_EQ(fromQt(files.items.front()).substr(0, 8), "file:///");
        EXPECT_EQ(QUrl(files.items.front()).toLocalFile(), toQt(image));
        EXPECT_TRUE(opened.isEmpty());
        bus.connection("files").unregisterService(QStringLiteral("org.freedesktop.FileManager1"));
    }
    command("showInFiles").trigger();
    ASSERT_TRUE(waitUntil([&] { return !opened.isEmpty(); }));
    EXPECT_EQ(opened.front().toLocalFile(), toQt(directory_.path().native()));
    EXPECT_EQ(sheet(), nullptr);
    canOpen = false;
    command("showInFiles").trigger();
    ASSERT_TRUE(waitUntil([&] { return sheet() != nullptr; }));
    EXPECT_NE(takeSheet().find("No file manager could be started."), std::string::npos);
}

TEST_F(DiskMenuTest, PropertiesAndTheReportHoldWhatIsKnown)
{
    const std::string image = makeDamagedImage("a <b>");
    open({image});
    run("verifyDiskButton", image);
    takeSheet();
    command("copyReport").trigger();
    const std::string report = fromQt(QApplication::clipboard()->text());
    for (const char* const part : {"a <b>.img", "damaged", "ext4", "Free blocks count wrong"})
        EXPECT_NE(report.find(part), std::string::npos) << part << " in " << report;

    QTest::keyClick(&window().disks(), Qt::Key_Return);
    auto* const dialog = window().findChild<QDialog*>(QStringLiteral("propertiesDialog"));
    ASSERT_NE(dialog, nullptr);
    QTest::mouseClick(dialog->findChild<QPushButton*>(QStringLiteral("copyProperties")),
                      Qt::LeftButton);
    const std::string copied = fromQt(QApplication::clipboard()->text());
    for (const std::string& part : {std::string("Label: a <b>\n"), "File: " + image + "\n",
                                    std::string("UUID: "), std::string("Format: ext4\n"),
                                    std::string("Size: 8.0 MiB (8"), std::string(": damaged. ")})
        EXPECT_NE(copied.find(part), std::string::npos) << part << " in " << copied;
    EXPECT_EQ(copied.find("Health"), std::string::npos) << "a file has no drive that could tell";
    const std::string read = fromQt(dialog->findChild<QTextEdit*>()->toPlainText());
    EXPECT_NE(read.find("a <b>"), std::string::npos) << "a label is text";
    dialog->close();
}

TEST_F(DiskMenuTest, ReturnPressesTheButtonThatHasTheFocus)
{
    openImage("image");
    QWidget& details = button("showDetailsButton").widget();
    window().activateWindow();
    details.setFocus();
    const bool before = button("showDetailsButton").isChecked();
    QTest::keyClick(&details, Qt::Key_Return);
    EXPECT_NE(button("showDetailsButton").isChecked(), before);
}

TEST_F(DiskMenuTest, FilesOverTheWindowAreAnnouncedUntilTheyLeave)
{
    open({});
    auto& note = *window().findChild<QWidget*>(QStringLiteral("dropNote"));
    const auto drag = [&](const QString& file) {
        QMimeData files;
        files.setUrls({QUrl::fromLocalFile(file)});
        QDragEnterEvent enter({10, 10}, Qt::CopyAction, &files, Qt::LeftButton, {});
        QCoreApplication::sendEvent(&window(), &enter);
    };
    drag(toQt(makeImage("dragged")));
    EXPECT_TRUE(note.isVisible());
    EXPECT_EQ(fromQt(note.accessibleName()), "Drop to open “dragged.img”");
    QDragLeaveEvent leave;
    QCoreApplication::sendEvent(&window(), &leave);
    EXPECT_FALSE(note.isVisible());
}

}  // namespace
}  // namespace orvane::desktop::test
