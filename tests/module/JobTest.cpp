// SPDX-License-Identifier: Apache-2.0
#include "tests/module/ModuleTest.h"

namespace fixwell {

// The queue

TEST_F(OVFXWTest, QueuesEachDiskOnceInTheOrderOfTheSelection)
{
    const auto whole = addWholeDisk("disk");
    const auto first = addDisk("disk1");
    const auto second = addDisk("disk2");
    verify(first, whole, second, first);
    finish(first);
    finish(whole);
    finish(second);
    const std::vector<std::string> expected{"verify disk1", "verify map disk", "verify disk2"};
    std::vector<std::string> begun;
    for (const std::string& entry : host.journal)
        if (entry.starts_with("verify "))
            begun.push_back(entry);
    EXPECT_EQ(begun, expected);
}

TEST_F(OVFXWTest, WholeDisksAreQueuedForTheirPartitionMapAlone)
{
    const auto whole = addWholeDisk("disk");
    select(whole);
    module->repairDisk(nullptr);
    EXPECT_TRUE(host.has("repair map disk"));
    EXPECT_EQ(action(), FXWActionRepairPartitionMap);
    finish(whole);
    EXPECT_EQ(host.report[kOVOP_ActionTypeKey].string(), "kOVOP_VerifyDiskKey");

    host.journal.clear();
    module->verifyPermissions(nullptr);
    EXPECT_TRUE(host.has("lock") && host.has("unlock") && host.has("report"))
        << "an empty queue starts and ends at once";
    EXPECT_EQ(host.report[kOVOP_ResultKey].string(), "kOVOP_FailKey");
    EXPECT_EQ(host.report.size(), 1U);

    host.canTreatPartitionMap = false;
    host.journal.clear();
    module->verifyDisk(nullptr);
    EXPECT_FALSE(host.has("verify map disk"));
    EXPECT_EQ(action(), FXWActionNone);
}

TEST_F(OVFXWTest, StartupDiskWarningAsksBeforeAVerification)
{
    const auto boot = addStartupDisk();
    select(boot);

    module->repairDisk(nullptr);
    EXPECT_FALSE(host.sheet) << "only a verification warns";
    finish(boot);

    module->verifyDisk(nullptr);
    ASSERT_TRUE(host.sheet);
    EXPECT_EQ(action(), FXWActionNone);
    EXPECT_EQ(host.sheet->defaultButton.key, "");
    EXPECT_EQ(host.sheet->alternateButton.key, "\r") << "Return cancels";
    EXPECT_EQ(host.sheet->alternateButton.tag, 1001);
    EXPECT_FALSE(button("verifyDiskButton").enabled);
    host.isMain = false;
    module->selectionDidChange({OVDiskChangedNotification, nullptr, {}});
    EXPECT_FALSE(host.sheet->defaultButton.enabled) << "the window is in the background";
    host.isMain = true;

    host.sheet->end(*host.sheet, 1001);
    EXPECT_EQ(action(), FXWActionNone);
    EXPECT_TRUE(module->actionList().isEmpty());
    EXPECT_FALSE(host.has("verify root"));
    EXPECT_TRUE(button("verifyDiskButton").enabled);

    module->verifyDisk(nullptr);
    host.sheet->end(*host.sheet, 1000);
    EXPECT_TRUE(host.sheet->isOrderedOut);
    EXPECT_TRUE(host.has("verify root"));
    EXPECT_EQ(action(), FXWActionVerifyDisk);
    finish(boot);

    host.sheet.reset();
    host.modifiers = modifierOption;
    module->verifyDisk(nullptr);
    EXPECT_FALSE(host.sheet) << "Option skips the warning";
    EXPECT_EQ(host.count("verify root"), 2);
}

// The runner

TEST_F(OVFXWTest, RunningStateLocksAndShowsProgress)
{
    const auto disk = addDisk("a");
    verify(disk);
    EXPECT_TRUE(host.isIndeterminate);
    EXPECT_EQ(host.status, "Verifying volume “a”");
    host.selection.clear();
    host.post({OVDiskAppearedNotification, disk, {}});
    host.post({OVDiskUnmountedNotification, disk, {}});
    host.post({OVDiskChangedNotification, disk, {}});
    EXPECT_EQ(module->selectionOfDisks()->size(), 1U) << "withheld while the job runs";
    host.post({OVDiskEjectedNotification, disk, {}});
    EXPECT_TRUE(module->selectionOfDisks()->empty()) << "ejecting is still observed";

    finish(disk);
    EXPECT_EQ(host.progress, 100.0);
    EXPECT_EQ(host.registrations.size(), 4U);
    EXPECT_EQ(action(), FXWActionNone);
    EXPECT_FALSE(inflightDisk());
    EXPECT_FALSE(host.isLocked);
}

TEST_F(OVFXWTest, OneBadDiskNeverStallsTheJob)
{
    const auto first = addDisk("a");
    const auto second = addDisk("b");
    const auto gone = addDisk("gone");
    gone->reference.reset();
    host.refusals = {{"a", kPLErrorToolMissing}, {"b", kPLErrorCouldNotUnmount}};
    verify(first, gone, second);
    EXPECT_TRUE(host.has("verify a") && host.has("verify b"));
    EXPECT_TRUE(host.has("report"));
    EXPECT_EQ(action(), FXWActionNone);
    EXPECT_EQ(linesOf(first), (std::vector<std::string>{"Verifying volume “a”\n",
                                                        "Verify volume failed: error -69704\n\n"}));
    EXPECT_EQ(linesOf(second), (std::vector<std::string>{"Verifying volume “b”\n",
                                                         "The disk “b” could not be unmounted\n"}));
    EXPECT_EQ(linesOf(gone), (std::vector<std::string>{"Verifying volume “gone”\n"}));
    EXPECT_EQ(verbosityOf(first->history.back().dictionary()), -2)
        << "the failed attempt is closed";
    EXPECT_EQ(verbosityOf(gone->history.back().dictionary()), -1) << "silently";
}

TEST_F(OVFXWTest, StopEndsTheJobInOrder)
{
    const auto first = addDisk("a");
    const auto second = addDisk("b");
    const auto third = addDisk("c");
    first->mount = "/mnt/a";
    verify(first, second, third);
    EXPECT_EQ(button("verifyDiskButton").action, "stopAction:");
    module->perform("stopAction:", nullptr);
    EXPECT_FALSE(button("verifyDiskButton").enabled);
    EXPECT_TRUE(host.has("cancel"));
    EXPECT_EQ(completedList().size(), 2U) << "the waiting entries count as finished";
    EXPECT_TRUE(inflightItem().boolean(kEntryStoppedByUser));
    EXPECT_FALSE(host.has("report")) << "not before the tool has ended";

    finish(first, kPLErrorCancelled);
    EXPECT_TRUE(host.has("report"));
    EXPECT_EQ(linesOf(first),
              (std::vector<std::string>{"Verifying volume “a”\n", "Stopped by user\n"}));
    EXPECT_TRUE(linesOf(second).empty());
    EXPECT_FALSE(host.has("verify b"));

    // After one stop, a job that ends well is remounted two seconds later as well.
    verify(second);
    finish(second);
    EXPECT_TRUE(host.has("timer 2.0"));
}

TEST_F(OVFXWTest, RemountsAfterAStopWhatWasMountedBefore)
{
    const auto stopped = addDisk("a");
    const auto other = addDisk("b");
    const auto never = addDisk("c");
    stopped->mount = "/mnt/a";
    verify(stopped, never, other);
    module->stopAction(nullptr);
    stopped->mount.reset();
    const Dictionary entry = inflightItem();
    finish(stopped, kPLNoError);  // it had ended by itself
    ASSERT_EQ(host.timers.size(), 1U);

    // The job is over and its list is empty when the timer fires; a new one is looked through.
    select(other, stopped);
    host.journal.clear();
    other->mount = "/mnt/b";
    module->verifyDisk(nullptr);
    fileAsCompleted(entry);
    host.timers.front()();
    EXPECT_TRUE(host.has("mount a synchronously"));
    EXPECT_FALSE(host.has("mount c synchronously"));
}

TEST_F(OVFXWTest, FailuresOfALauncherAreRestatedByTheKindOfDisk)
{
    struct Case {
        FXWAction action;
        bool isBoot;
        bool isHome;
        ErrorCode shown;
    };
    for (const Case& c : {Case{FXWActionVerifyDisk, true, false, -19997},
                          Case{FXWActionVerifyDisk, false, true, -19997},
                          Case{FXWActionVerifyDisk, false, false, -19998},
                          Case{FXWActionRepairDisk, true, false, -19996},
                          Case{FXWActionVerifyPermissions, false, true, -19998},
                          Case{FXWActionRepairPermissions, true, false, -19997}}) {
        const auto disk = addDisk("d" + std::to_string(host.disks.size()));
        disk->boot = c.isBoot;
        disk->home = c.isHome;
        host.refusals[disk->identifier] = kPLErrorDiskInUse;
        host.modifiers = modifierOption;
        select(disk);
        const Selector selectors[] = {"", "verifyPermissions:", "repairPermissions:", "",
                                      "", "verifyDisk:",        "repairDisk:"};
        module->perform(selectors[c.action], nullptr);
        EXPECT_NE(linesOf(disk)[1].find("error " + std::to_string(c.shown)), std::string::npos)
            << c.action << " " << linesOf(disk)[1];
    }
}

TEST_F(OVFXWTest, ADiskThatAFailedStartUnmountedIsMountedAgain)
{
    const auto disk = addDisk("a");
    disk->mount = "/mnt";
    host.refusals["a"] = kPLErrorToolMissing;
    verify(disk);
    EXPECT_FALSE(host.has("mount a")) << "still mounted";
    host.whenBegun = [&disk] {
        disk->mount.reset();
    };
    module->verifyDisk(nullptr);
    EXPECT_TRUE(host.has("mount a"));

    // A mount point without a length was never one.
    host.journal.clear();
    host.whenBegun = {};
    disk->mount = "";
    module->verifyDisk(nullptr);
    EXPECT_FALSE(host.has("mount a"));
}

// Disk images

TEST_F(OVFXWTest, ImagesAreAttachedFirstAndEjectedAfterwards)
{
    const auto top = addWholeDisk("top");
    const auto volume1 = addDisk("top#1");
    const auto volume2 = addDisk("top#2");
    top->volumes = {volume1, volume2};
    const auto bare = addDisk("bare");
    host.images = {{"/gpt.img", top}, {"/bare.img", bare}};
    const auto plain = addDisk("sda1");
    verify(addImage("/gpt.img"), plain, addImage("/broken.img"), addImage("/bare.img"));
    ASSERT_EQ(host.workers.size(), 3U);
    EXPECT_TRUE(host.has("lock")) << "the job is running already";
    for (const auto& worker : host.workers) {
        EXPECT_FALSE(host.has("verify sda1")) << "not before all have reported";
        worker();
        host.runTasks();
    }
    EXPECT_EQ(host.count("sleep 0.5"), 2);
    for (const auto& disk : {plain, volume1, volume2, bare}) {
        EXPECT_TRUE(host.has("verify " + disk->identifier)) << disk->identifier;
        EXPECT_FALSE(host.has("eject bare synchronously"));
        finish(disk);
    }
    EXPECT_TRUE(host.has("eject top synchronously") && host.has("eject bare synchronously"));
    EXPECT_TRUE(host.has("report"));
}

TEST_F(OVFXWTest, TheStartupDiskIsAskedAboutBeforeAnImageIsAttached)
{
    const auto boot = addStartupDisk();
    const auto bare = addDisk("bare");
    host.images = {{"/bare.img", bare}};
    verify(addImage("/bare.img"), boot);
    ASSERT_TRUE(host.sheet);
    EXPECT_TRUE(host.workers.empty());
    host.sheet->end(*host.sheet, 1001);
    EXPECT_TRUE(host.workers.empty()) << "cancelled, so nothing is attached";
    EXPECT_EQ(action(), FXWActionNone);

    module->verifyDisk(nullptr);
    host.sheet->end(*host.sheet, 1000);
    ASSERT_EQ(host.workers.size(), 1U);
    EXPECT_FALSE(host.has("verify root"));
    host.workers.front()();
    host.runTasks();
    finish(boot);
    EXPECT_TRUE(host.has("verify bare"));
    finish(bare);
    EXPECT_EQ(host.count("lock"), 1);
}

TEST_F(OVFXWTest, AnImageWithoutAPathNeverStartsTheJob)
{
    select(addImage(""), addDisk("a"));
    module->repairDisk(nullptr);
    host.workers.front()();
    host.runTasks();
    EXPECT_FALSE(host.has("repair a"));
    EXPECT_EQ(action(), FXWActionRepairDisk);
}

// The end of a job

TEST_F(OVFXWTest, OneReportAndOneWarningPerJob)
{
    const auto first = addDisk("a");
    const auto second = addDisk("b");
    const auto third = addDisk("c");
    second->name = "B %@ \n";
    verify(first, second, third);
    finish(first);
    finish(second, kPLErrorDamaged);
    finish(third, kPLErrorToolFailed);
    EXPECT_EQ(host.count("report"), 1);
    EXPECT_EQ(host.report[kOVOP_ResultKey].string(), "kOVOP_SuccessKey");
    EXPECT_EQ(host.report[kOVOP_DiskKey].object(), first);
    EXPECT_TRUE(host.has("alert [Orvane stopped verifying “B %@ \n”] [error -69701] 0"));
    EXPECT_EQ(std::count_if(host.journal.begin(), host.journal.end(),
                            [](const auto& entry) { return entry.starts_with("alert"); }),
              1);
    EXPECT_EQ(linesOf(second).back(), "\n");
    EXPECT_TRUE(host.has("mount b with children")) << "a failed disk is mounted at once";
    EXPECT_FALSE(host.has("mount a with children"));
    host.journal.clear();
    module->repairPermissions(nullptr);
    for (const auto& disk : {first, second, third})
        finish(disk, kPLErrorToolFailed);
    EXPECT_TRUE(std::ranges::none_of(host.journal, [](const auto& entry) {
        return entry.starts_with("alert");
    })) << "permission runs never warn";
}

TEST_F(OVFXWTest, TheReportNamesTheAction)
{
    const auto disk = addDisk("a");
    select(disk);
    for (const auto& [selector, key] :
         {std::pair("verifyPermissions:", "kOVOP_VerifyDiskPermissionsKey"),
          {"repairPermissions:", "kOVOP_RepairDiskPermissionsKey"},
          {"verifyDisk:", "kOVOP_VerifyDiskKey"},
          {"repairDisk:", "kOVOP_RepairDiskKey"}}) {
        module->perform(selector, nullptr);
        finish(disk);
        EXPECT_EQ(host.report[kOVOP_ActionTypeKey].string(), key);
    }
}

}  // namespace fixwell
