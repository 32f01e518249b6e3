// SPDX-License-Identifier: Apache-2.0
#include "tests/desktop/WindowFixture.h"

#include "orvane/desktop/toolkit/Text.h"
#include "tests/support/ToolRun.h"

#include <QApplication>
#include <QClipboard>
#include <QMimeData>
#include <QTest>

#include <fstream>

namespace orvane::desktop::test {
namespace {

using WindowTest = WindowFixture;

TEST_F(WindowTest, TheButtonsFindAndRepairWhatIsDamaged)
{
    struct Case {
        std::string image;
        std::string verdict;
        std::string row;
        bool alerts;
    };
    const std::string sound = makeImage("sound");
    const std::string damaged = makeDamagedImage("damaged");
    open({sound, damaged});
    for (const Case& c : {Case{sound, "sound", "appears to be OK", false},
                          Case{damaged, "damaged", "needs to be repaired", true}}) {
        select(c.image);
        EXPECT_EQ(verdict(c.image), "") << "before it was checked";
        button("verifyDiskButton").press();
        EXPECT_EQ(button("verifyDiskButton").title(), "Stop Verify");
        EXPECT_FALSE(button("repairDiskButton").isEnabled()) << "another job runs";
        ASSERT_TRUE(waitForJob());
        EXPECT_EQ(verdict(c.image), c.verdict);
        EXPECT_NE(cell(c.image, DiskColumn::LastCheck), "");
        EXPECT_TRUE(logHolds(c.row)) << testing::PrintToString(logRows());
        EXPECT_EQ(takeSheet().find("damaged") != std::string::npos, c.alerts);
    }
    run("repairDiskButton", damaged);
    EXPECT_EQ(verdict(damaged), "repaired");
    run("verifyDiskButton", damaged);
    EXPECT_EQ(verdict(damaged), "sound");
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
    const QMimeData& copied = *QApplication::clipboard()->mimeData();
    EXPECT_NE(fromQt(copied.text()).find("“a <b>” appears to be OK"), std::string::npos);
    EXPECT_NE(fromQt(copied.html()).find("“a &lt;b&gt;” appears to be OK"), std::string::npos)
        << fromQt(copied.html());
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
    EXPECT_FALSE(clear.isEnabled());
    button("verifyDiskButton").press();
    ASSERT_TRUE(waitForJob());
    const auto rows = logRows();
    EXPECT_TRUE(clear.isEnabled());
    clear.press();
    EXPECT_FALSE(clear.isEnabled());
    EXPECT_TRUE(logRows().empty());
    for (const std::string& image : images)
        EXPECT_EQ(verdict(image), "") << "the list follows at once";
    command("undoClear").trigger();
    EXPECT_EQ(logRows(), rows);
    EXPECT_TRUE(clear.isEnabled());
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
    button("verifyDiskButton").press();
    ASSERT_TRUE(waitForJob());
    EXPECT_TRUE(logHolds("Stopped by user")) << testing::PrintToString(logRows());
    EXPECT_EQ(verdict(image), "sound");
    EXPECT_NE(cell(image, DiskColumn::LastCheck).find("then stopped"), std::string::npos)
        << cell(image, DiskColumn::LastCheck);
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
    EXPECT_FALSE(window().isVisible());
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
    EXPECT_EQ(cell(volume, DiskColumn::Format), "ext4");
    run("verifyDiskButton", volume);
    EXPECT_EQ(verdict(volume), "sound");
    EXPECT_EQ(disks.rowCount(disks.index(0, 0)), 2) << "they stay after the job";

    command("eject").trigger();
    // A disk of a job keeps its place until the job is over in every respect.
    EXPECT_TRUE(waitUntil([&disks] { return disks.rowCount() == 0; }));
    EXPECT_FALSE(button("verifyDiskButton").isEnabled()) << "nothing is selected any more";
}

TEST_F(WindowTest, TheMapOfAnImageIsVerifiedAndRepaired)
{
    const std::string image = makePartitionedImage("partitioned");
    std::fstream(image) << std::string(1024, '\0');  // the boot record and the primary header
    open({image});
    select(image);
    EXPECT_NE(details(image).find("its partition map is damaged"), std::string::npos);
    command("verifyMap").trigger();
    EXPECT_EQ(button("verifyDiskButton").title(), "Stop Verify");
    ASSERT_TRUE(waitForJob());
    EXPECT_TRUE(waitUntil([&] { return verdict(image) == "damaged"; }));
    takeSheet();
    command("repairMap").trigger();
    ASSERT_TRUE(waitForJob());
    EXPECT_TRUE(waitUntil([&] {
        return details(image).find("partition map is damaged") == std::string::npos;
    })) << testing::PrintToString(logRows());
    EXPECT_EQ(orvane::test::runTool({"sfdisk", "-q", "--verify", image}), 0);
}

TEST_F(WindowTest, AGreyButtonSaysWhyAndForWhichDisk)
{
    const std::string image = makeImage("image");
    const std::string locked = makeImage("locked");
    useEndlessTool();
    open({image, locked});
    window().disks().clearSelection();
    const auto toolTip = [this](const char* name) {
        return fromQt(button(name).widget().toolTip());
    };
    const auto says = [&](const char* name, const std::string& reason) {
        return waitUntil([&] { return toolTip(name).find(reason) != std::string::npos; });
    };
    EXPECT_TRUE(says("verifyDiskButton", "Select a disk first.")) << toolTip("verifyDiskButton");
    select(image);
    EXPECT_TRUE(says("clearHistoryButton", "There is no history to clear."));
    window().disks().selectAll();
    EXPECT_TRUE(says("verifyPermissionsButton", "“locked.img”: "))
        << toolTip("verifyPermissionsButton");
    button("verifyDiskButton").press();
    EXPECT_TRUE(says("repairDiskButton", "Not available while a job runs."));
    button("verifyDiskButton").press();
    ASSERT_TRUE(waitForJob());
    EXPECT_EQ(toolTip("repairDiskButton").find("while a job runs"), std::string::npos);
}

TEST_F(WindowTest, TheEmptyLogSaysWhyNothingCanBeDone)
{
    open({});
    DiskTree disk;
    disk.facts.identifier = "/dev/none";
    disk.facts.type = diskType::bareVolume;
    disk.facts.storage = contract::DiskReference::Storage::BlockDevice;
    disk.facts.filesystem = "ext4";
    const EmptyNote* const note = session().activeTab()->interface()->emptyNote();
    ASSERT_NE(note, nullptr);
    struct Case {
        bool isBootVolume;
        std::string_view said;
    };
    for (const Case& c : {Case{true, "rescue system"}, Case{false, "no history"}}) {
        disk.facts.isBootVolume = c.isBootVolume;
        session().host().sharedDiskController().synchronize({});
        session().host().sharedDiskController().synchronize({disk});
        select(disk.facts.identifier);
        EXPECT_NE(fromQt(note->text()).find(c.said), std::string::npos) << fromQt(note->text());
        const QtButton& verify = button("verifyDiskButton");
        EXPECT_NE(verify.isEnabled(), c.isBootVolume);
        EXPECT_TRUE(!c.isBootVolume || waitUntil([&] {
            return fromQt(verify.widget().toolTip()).find(c.said) != std::string::npos;
        })) << "also where a history stands in the log's place";
    }
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
