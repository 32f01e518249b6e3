// SPDX-License-Identifier: Apache-2.0
#include "tests/desktop/WindowFixture.h"

#include "orvane/desktop/toolkit/Text.h"
#include "tests/support/TestDirectory.h"

#include <QApplication>
#include <QClipboard>
#include <QMimeData>

namespace orvane::desktop::test {
namespace {

using WindowTest = WindowFixture;

TEST_F(WindowTest, TheButtonsFindWhatIsDamaged)
{
    const std::string sound = makeImage("sound");
    const std::string damaged = makeDamagedImage("damaged");
    open({sound, damaged});
    for (const auto& [image, expected] :
         {std::pair(sound, "sound"), std::pair(damaged, "damaged")}) {
        select(image);
        EXPECT_EQ(verdict(image), "") << "before it was checked";
        button("verifyDiskButton").press();
        EXPECT_FALSE(button("repairDiskButton").isEnabled()) << "another job runs";
        ASSERT_TRUE(waitForJob());
        EXPECT_EQ(verdict(image), expected);
        EXPECT_NE(cell(image, DiskColumn::LastCheck), "");
        EXPECT_TRUE(waitUntil([&] {
            return result().starts_with(image == sound ? "No damage was found." : "Damaged: ");
        })) << result();
        EXPECT_EQ(takeSheet(), "");
    }
}

TEST_F(WindowTest, TheLogIsCopiedAndDeletedByTheMenus)
{
    run("verifyDiskButton", openImage("a <b>"));
    ASSERT_FALSE(logRows().empty());
    QApplication::clipboard()->clear();
    command("copy").trigger();
    EXPECT_EQ(fromQt(QApplication::clipboard()->text()), "") << "no row is selected";
    log().setFocus();
    command("selectAll").trigger();
    command("copy").trigger();
    const QString html = QApplication::clipboard()->mimeData()->html();
    EXPECT_NE(fromQt(html).find("“a &lt;b&gt;” appears to be OK"), std::string::npos);
    command("delete").trigger();
    EXPECT_TRUE(logRows().empty());
}

TEST_F(WindowTest, WhatWasClearedCanBeBroughtBack)
{
    const std::vector<std::string> images{makeImage("one"), makeImage("two")};
    open(images);
    select(images[0]);
    QtButton& clear = button("clearHistoryButton");
    EXPECT_FALSE(clear.isEnabled()) << "never checked";
    window().disks().selectAll();
    run("verifyDiskButton");
    const auto rows = logRows();
    clear.press();
    EXPECT_FALSE(clear.isEnabled());
    EXPECT_TRUE(logRows().empty());
    for (const std::string& image : images)
        EXPECT_EQ(verdict(image), "") << "the list follows at once";
    command("undoClear").trigger();
    EXPECT_EQ(logRows(), rows);
    command("undoClear").trigger();
    EXPECT_EQ(logRows(), rows) << "there is nothing more to bring back";
    close();
    open(images);
    window().disks().selectAll();
    EXPECT_EQ(logRows(), rows) << "it is kept";
    for (const std::string& image : images)
        EXPECT_EQ(verdict(image), "sound");
}

TEST_F(WindowTest, AJobCanBeStoppedAndTheLastVerdictStands)
{
    const std::string image = openImage("sound");
    run("verifyDiskButton", image);
    close();
    useEndlessTool();
    open({image});
    select(image);
    button("verifyDiskButton").press();
    ASSERT_TRUE(waitUntil([&] { return verdict(image) == "verifying…"; }));
    run("verifyDiskButton");
    EXPECT_TRUE(logHolds("Stopped by user")) << testing::PrintToString(logRows());
    EXPECT_EQ(verdict(image), "sound");
    EXPECT_NE(cell(image, DiskColumn::LastCheck).find("then stopped"), std::string::npos);
}

TEST_F(WindowTest, ClosingDuringARepairAsks)
{
    useEndlessTool();
    const std::string image = openImage("sound");
    button("repairDiskButton").press();
    ASSERT_TRUE(waitUntil([&] { return verdict(image) == "repairing…"; }));

    window().close();
    ASSERT_NE(sheet(), nullptr);
    press(*sheet(), QStringLiteral("Keep Open"));
    EXPECT_TRUE(window().isVisible());
    EXPECT_EQ(button("repairDiskButton").title(), "Stop Repair") << "the job goes on";
    window().close();
    ASSERT_NE(sheet(), nullptr);
    press(*sheet(), QStringLiteral("Stop and Quit"));
    EXPECT_TRUE(waitUntil([&] { return wasClosed_; }));
}

// As the system asks when it is shut down: no user is there to answer a question.
TEST_F(WindowTest, AProgramThatIsToldToEndStopsItsJobUnasked)
{
    useEndlessTool();
    const std::string image = openImage("sound");
    button("verifyDiskButton").press();
    session().end();  // before the image was even read
    EXPECT_TRUE(waitUntil([&] { return wasClosed_; }));
    close();
    ::unsetenv("FIXWELL_TOOL_PATH");
    open({image});
    EXPECT_EQ(verdict(image), "stopped");
}

TEST_F(WindowTest, AnImageWithPartitionsShowsItsVolumes)
{
    const std::string image = makePartitionedImage("partitioned");
    open({image});
    const QAbstractItemModel& disks = *window().disks().model();
    ASSERT_EQ(disks.rowCount(), 1);
    ASSERT_EQ(disks.rowCount(disks.index(0, 0)), 2);
    const std::string volume = image + "#1";
    run("verifyDiskButton", volume);
    EXPECT_EQ(verdict(volume), "sound");
    EXPECT_EQ(disks.rowCount(disks.index(0, 0)), 2) << "they stay after the job";

    command("closeImage").trigger();
    // A disk of a job keeps its place until the job is over in every respect.
    EXPECT_TRUE(waitUntil([&disks] { return disks.rowCount() == 0; }));
    EXPECT_FALSE(button("verifyDiskButton").isEnabled()) << "nothing is selected any more";
}

TEST_F(WindowTest, AGreyButtonSaysWhyAndForWhichDisk)
{
    const std::string image = makeImage("image");
    const std::string locked = makeImage("locked");
    useEndlessTool();
    open({image, locked});
    window().disks().clearSelection();
    const auto says = [this](const char* name, const std::string& reason) {
        return waitUntil([&] {
            return fromQt(button(name).widget().toolTip()).find(reason) != std::string::npos;
        });
    };
    EXPECT_TRUE(says("verifyDiskButton", "Select a disk first."));
    window().disks().selectAll();
    EXPECT_TRUE(says("verifyPermissionsButton", "“locked.img”: "));
    button("verifyDiskButton").press();
    EXPECT_TRUE(says("repairDiskButton", "Not available while a job runs."));
    run("verifyDiskButton");
}

TEST_F(WindowTest, WhatCannotBeOpenedIsSaidInOneSheet)
{
    const std::string image = makeImage("sound");
    const std::string missing = directory_ / "<b>missing</b>.img";
    open({image});
    QMimeData files;
    files.setUrls(
        {QUrl::fromLocalFile(toQt(missing)), QUrl::fromLocalFile(QStringLiteral("/dev/null"))});
    QDragEnterEvent enter({10, 10}, Qt::CopyAction, &files, Qt::LeftButton, {});
    QCoreApplication::sendEvent(&window(), &enter);
    EXPECT_TRUE(enter.isAccepted());
    QDropEvent drop({10, 10}, Qt::CopyAction, &files, Qt::LeftButton, {});
    QCoreApplication::sendEvent(&window(), &drop);
    ASSERT_TRUE(waitUntil([&] { return sheet() != nullptr; }));
    const std::string text = takeSheet();
    EXPECT_NE(text.find("<b>missing</b>.img"), std::string::npos) << text;
    EXPECT_NE(text.find("/dev/null"), std::string::npos) << text;
}

TEST_F(WindowTest, TheWindowStandsWhereItStood)
{
    open({});
    window().resize(900, 650);
    window().splitter().setSizes({300, 600});
    const QList<int> sizes = window().splitter().sizes();
    window().close();
    close();
    open({});
    EXPECT_EQ(window().size(), QSize(900, 650));
    EXPECT_EQ(window().splitter().sizes(), sizes);
}

}  // namespace
}  // namespace orvane::desktop::test
