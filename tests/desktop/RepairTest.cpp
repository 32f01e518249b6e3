// SPDX-License-Identifier: Apache-2.0
// What the window does about repairs beyond the module's buttons.

#include "tests/desktop/WindowFixture.h"
#include "tests/support/InterruptedRepair.h"
#include "tests/support/LoopDevice.h"

#include "orvane/desktop/KeptRepairs.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/support/settings/Switch.h"
#include "pellar/permissions/PermissionRecords.h"
#include "pellar/probe/DiskProbe.h"

#include <QCheckBox>
#include <QCoreApplication>
#include <QMenu>
#include <QPushButton>

#include <fcntl.h>
#include <sys/mount.h>
#include <sys/stat.h>

#include <cstdlib>

namespace orvane::desktop::test {
namespace {

using orvane::test::contentsOf;
using pellar::Operation;

// What no window of the tests below comes to.
TEST(UndoAvailability, SaysWhatIsMissing)
{
    for (const auto& [situation, reason] :
         {std::pair(UndoSituation{1, false, true, KeptRepair::Unknown}, ""),
          {{1, false, true, KeptRepair::InUse}, "A program works on the last repair of this disk."},
          {{1, false, true, KeptRepair::Others},
           "Another user asked for the last repair of this disk."},
          {{1, false, true, KeptRepair::None, true},
           "No repair of permissions on this disk is kept."},
          {{0, false, false, KeptRepair::None}, "Select a disk first."},
          {{2, false, true, KeptRepair::Applied}, "Select one disk alone."},
          {{1, false, false, KeptRepair::Applied}, "Not available for this disk."}})
        for (const Operation operation : {Operation::Undo, Operation::Finish})
            EXPECT_EQ(reasonAgainst(operation, situation), reason);
}

class RepairTest : public WindowFixture {
protected:
    /// A tool that finds damage, changes something in a repair, and leaves damage.
    void useFailingTool()
    {
        const std::string tools = directory_.fakeTools("write-in-repair changed\nexit 4");
        ::setenv("FIXWELL_TOOL_PATH", tools.c_str(), 1);
    }
    /// Why the command is grey in the open menu; empty when it is not.
    std::string whyGrey(const char* name)
    {
        emit qobject_cast<QMenu*>(command(name).parent())->aboutToShow();
        const std::string toolTip = fromQt(command(name).toolTip());
        return command(name).isEnabled() ? std::string() : toolTip;
    }
    std::string details(const std::string& image)
    {
        return fromQt(row(image).data(DiskTreeModel::DetailsRole).toString());
    }
    /// Waits until the sheet is there, and gives this answer.
    void answer(const char* sheetName, const char* title)
    {
        ASSERT_TRUE(waitUntil([&] {
            return sheet() != nullptr && fromQt(sheet()->objectName()) == sheetName;
        })) << sheetName;
        const std::string byHabit = fromQt(sheet()->defaultButton()->text());
        EXPECT_TRUE(byHabit == "Close" || byHabit == "Cancel") << byHabit;
        EXPECT_EQ(sheet()->defaultButton(), sheet()->escapeButton());
        const QPointer<QMessageBox> answered = sheet();
        press(*answered, toQt(title));
        ASSERT_TRUE(waitUntil([&] { return !answered || !answered->isVisible(); }));
    }
    bool isFree()
    {
        return waitUntil([&] {
            return button("repairDiskButton").isEnabled() &&
                   button("repairDiskButton").action() == "repairDisk:";
        });
    }
};

TEST_F(RepairTest, ARepairIsPreviewedDoneAndTakenBack)
{
    const std::string image = makeDamagedImage("damaged");
    const std::string before = contentsOf(image);
    open({image});
    select(image);
    EXPECT_NE(whyGrey("undoRepair").find("No repair of this disk is kept."), std::string::npos);
    EXPECT_NE(whyGrey("undoPermissions").find("Not available for this disk."), std::string::npos)
        << "it is not mounted";

    command("previewRepair").trigger();
    ASSERT_TRUE(waitForJob());
    EXPECT_EQ(verdict(image), "damaged");
    EXPECT_TRUE(contentsOf(image) == before) << "a preview writes nothing";
    takeSheet();
    ASSERT_TRUE(isFree());
    run("repairDiskButton");
    EXPECT_EQ(verdict(image), "repaired") << "only that one job was a preview";
    EXPECT_TRUE(logHolds("choose Undo Repair in the Disk menu"));
    EXPECT_EQ(sheet(), nullptr) << takeSheet();
    const std::string repaired = contentsOf(image);
    ASSERT_FALSE(repaired == before);

    ASSERT_TRUE(isFree());
    EXPECT_TRUE(waitUntil([&] { return whyGrey("undoRepair").empty(); }));
    EXPECT_NE(whyGrey("finishRepair").find("was not interrupted"), std::string::npos);
    command("undoRepair").trigger();
    EXPECT_TRUE(sheet()->informativeText().contains(QStringLiteral(" bytes in ")));
    answer("undoQuestion", "Undo Repair");
    QCoreApplication::sendPostedEvents(&window());
    EXPECT_EQ(verdict(image), "undoing…");
    EXPECT_FALSE(button("verifyDiskButton").isEnabled()) << "no other job begins meanwhile";
    EXPECT_NE(whyGrey("undoRepair").find("while a job runs"), std::string::npos);
    EXPECT_TRUE(window().findChild<QPushButton*>(QStringLiteral("stopButton"))->isVisible());
    window().close();
    EXPECT_TRUE(window().isVisible()) << "it asks first";
    ASSERT_TRUE(isFree());
    EXPECT_FALSE(window().findChild<QPushButton*>(QStringLiteral("stopButton"))->isVisible());
    EXPECT_TRUE(waitUntil([&] { return sheet() == nullptr; })) << "there is nothing left to ask";
    EXPECT_EQ(verdict(image), "undone");
    EXPECT_TRUE(contentsOf(image) == before) << "it is as it was, to the byte";
    EXPECT_TRUE(logHolds("Undid the repair of “damaged”")) << testing::PrintToString(logRows());
    EXPECT_NE(whyGrey("undoRepair"), "") << "what was put back is not kept any longer";
}

TEST_F(RepairTest, AMapIsVerifiedRepairedAndTakenBack)
{
    const std::string image = makePartitionedImage("partitioned");
    orvane::test::patch(image, 0, std::string(1024, '\0'));
    const std::string before = contentsOf(image);
    open({image});
    select(image);
    command("verifyMap").trigger();
    ASSERT_TRUE(waitForJob());
    EXPECT_TRUE(waitUntil([&] { return verdict(image) == "damaged"; }));
    takeSheet();
    command("repairMap").trigger();
    ASSERT_TRUE(waitForJob());
    EXPECT_EQ(orvane::test::runTool({"sfdisk", "-q", "--verify", image}).status, 0);
    ASSERT_TRUE(waitUntil([&] { return whyGrey("undoRepair").empty(); })) << whyGrey("undoRepair");
    command("undoRepair").trigger();
    answer("undoQuestion", "Undo Repair");
    EXPECT_TRUE(waitUntil([&] { return contentsOf(image) == before; }));
    ASSERT_TRUE(isFree());
}

/// A file on what is mounted at `root`, made 0644 by a repair whose record is left as it was.
void repairPermissionsOf(const std::filesystem::path& root, const std::string& device,
                         const std::filesystem::path& records)
{
    const std::string file = root / "file";
    orvane::test::write(file, "");
    struct stat status = {};
    const auto stateWith = [&](mode_t mode) {
        ::chmod(file.c_str(), mode);
        ::stat(file.c_str(), &status);
        return pellar::stateOf({pellar::FileKind::Regular, mode, 0, 0, {}}, status);
    };
    pellar::RecordedChange change;
    change.path = "file";
    change.before = stateWith(0600);
    change.device = status.st_dev;
    change.inode = status.st_ino;
    change.wanted = {pellar::FileKind::Regular, 0644, 0, 0, {}};
    const pellar::FileDescriptor opened(::open(device.c_str(), O_RDONLY | O_CLOEXEC));
    pellar::PermissionsRun run;
    run.repair.disk = {device, 0, 1, pellar::readSuperblock(opened.get(), {0, 1U << 20U}).uuid,
                       "ext4", ""};
    run.repair.time = std::chrono::system_clock::now();
    run.mountPoint = root;
    run.rootDevice = status.st_dev;
    auto record = *pellar::PermissionRecords::open(records)->begin(run);
    EXPECT_EQ(record.add({change}), 0);
    EXPECT_EQ(record.note(0, pellar::ChangeStage::Changed, stateWith(0644)), 0);
}

TEST_F(RepairTest, ARepairOfPermissionsIsTakenBack)
{
    if (const char* const obstacle = orvane::test::LoopDevice::obstacle())
        GTEST_SKIP() << obstacle;
    const orvane::test::LoopDevice device(makeImage("system"));
    const auto root = directory_.path("root");
    std::filesystem::create_directory(root);
    if (::mount(device.name().c_str(), root.c_str(), "ext4", 0, nullptr) != 0)
        GTEST_SKIP() << "the system does not let ext4 be mounted";
    const std::unique_ptr<const std::filesystem::path, void (*)(const std::filesystem::path*)>
        mounted(&root, [](const auto* path) { ::umount2(path->c_str(), MNT_DETACH); });
    orvane::test::write(root / "var/lib/dpkg/status", "Package: one\n");
    orvane::test::write(root / "etc/passwd", "");
    repairPermissionsOf(root, device.name(), directory_ / "state/repairs/permission-records");
    openWithSystemDisks();
    ASSERT_TRUE(
        waitUntil([&] { return cell(device.name(), DiskColumn::MountPoint) == root.native(); }));
    select(device.name());
    EXPECT_EQ(whyGrey("undoPermissions"), "");
    EXPECT_NE(whyGrey("undoRepair").find("No repair of this disk is kept."), std::string::npos);
    command("undoPermissions").trigger();
    EXPECT_TRUE(
        sheet()->informativeText().contains(QStringLiteral("owner, group and permissions")));
    answer("undoQuestion", "Undo Repair");
    EXPECT_TRUE(waitUntil([&] { return verdict(device.name()) == "undone"; }))
        << verdict(device.name()) << testing::PrintToString(logRows());
    struct stat status = {};
    EXPECT_EQ(::stat((root / "file").c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 07777, 0600U);
    ASSERT_TRUE(isFree());
    EXPECT_NE(whyGrey("undoPermissions").find("No repair of permissions on this disk is kept."),
              std::string::npos);
    close();
}

TEST_F(RepairTest, WhatIsNotProvenIsAppliedOnlyWhereTheUserSaysSoTwice)
{
    const std::string image = makeImage("image");
    const std::string before = contentsOf(image);
    useFailingTool();
    open({image});
    run("repairDiskButton", image);
    take(NextStep::ApplyUnproven);
    answer("unprovenConfirmation", "Cancel");
    EXPECT_TRUE(contentsOf(image) == before);
    take(NextStep::ApplyUnproven);
    answer("unprovenConfirmation", "Apply Repair");
    ASSERT_TRUE(waitUntil([&] { return contentsOf(image).starts_with("changed"); }));
    ASSERT_TRUE(isFree());
    EXPECT_TRUE(waitUntil([&] { return result() == "Damage is left after the repair."; }));
    EXPECT_EQ(sheet(), nullptr) << "said once, not by the module as well: " << takeSheet();
    run("repairDiskButton");
    EXPECT_TRUE(waitForStep(NextStep::ApplyUnproven)) << "that was for one repair";
}

TEST_F(RepairTest, WhatCannotBeTriedIsRepairedDirectlyOnlyWhereTheUserSaysSo)
{
    const std::string image = makeImage("image");
    const std::string before = contentsOf(image);
    useFailingTool();
    directory_.write("state/repairs", "no directory");
    open({image});
    run("repairDiskButton", image);
    take(NextStep::RepairDirectly);
    EXPECT_TRUE(contentsOf(image) == before);
    answer("directConfirmation", "Repair Directly");
    EXPECT_TRUE(waitUntil([&] { return contentsOf(image).starts_with("changed"); }));
    ASSERT_TRUE(isFree());
}

TEST_F(RepairTest, AnInterruptedRepairIsPointedOutAndLeadsBothWays)
{
    for (const bool isUndo : {true, false}) {
        const std::string image = makeImage(isUndo ? "undone" : "finished");
        const std::string before = contentsOf(image);
        const std::string repaired =
            orvane::test::interruptRepair(image, directory_ / "state/repairs/records");
        open({image});
        EXPECT_EQ(details(image), "repair interrupted");
        select(image);
        take(isUndo ? NextStep::Undo : NextStep::Finish);
        answer("undoQuestion", isUndo ? "Undo Repair" : "Finish Repair");
        ASSERT_TRUE(waitUntil([&] { return verdict(image) == (isUndo ? "undone" : "repaired"); }));
        EXPECT_TRUE(contentsOf(image) == (isUndo ? before : repaired));
        EXPECT_TRUE(waitUntil([&] { return details(image) != "repair interrupted"; }));
        ASSERT_TRUE(isFree());
        EXPECT_EQ(sheet(), nullptr) << takeSheet();
        close();
    }
}

TEST_F(RepairTest, WhatWillBeWrittenIsSaidFirst)
{
    const std::string image = makeDamagedImage("damaged");
    const std::string before = contentsOf(image);
    asksFirst_ = true;
    open({image});
    select(image);
    button("repairDiskButton").press();
    answer("repairQuestion", "Cancel");
    button("repairDiskButton").press();
    answer("repairQuestion", "Preview");
    ASSERT_TRUE(waitForStep(NextStep::Repair)) << result();
    EXPECT_TRUE(contentsOf(image) == before);
    take(NextStep::Repair);
    ASSERT_TRUE(waitUntil([this] { return sheet() != nullptr; }));
    sheet()->checkBox()->setChecked(false);
    answer("repairQuestion", "Repair");
    EXPECT_TRUE(waitForStep(NextStep::Undo)) << result();
    EXPECT_EQ(verdict(image), "repaired");
    button("repairDiskButton").press();
    EXPECT_EQ(sheet(), nullptr) << "that was not wanted any more";
    ASSERT_TRUE(isFree());
}

TEST_F(RepairTest, VerifyingThoroughlyIsKeptAndTriesARepair)
{
    const std::string image = openImage("sound");
    run("verifyDiskButton");
    EXPECT_FALSE(logHolds("Trying a repair"));
    thoroughVerification.set(session().host().standardUserDefaults(), true);
    close();
    open({image});
    run("verifyDiskButton", image);
    command("showDetails").trigger();
    EXPECT_TRUE(logHolds("Trying a repair")) << testing::PrintToString(logRows());
    EXPECT_EQ(verdict(image), "sound");
}

}  // namespace
}  // namespace orvane::desktop::test
