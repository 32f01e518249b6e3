// SPDX-License-Identifier: Apache-2.0
#include "contract/toolkit/ControlNames.h"
#include "tests/module/ModuleTest.h"

namespace fixwell {

TEST_F(OVFXWTest, ButtonsFollowTheRulesDiskByDisk)
{
    struct Case {
        std::vector<testing::FakeFacts> disks;  ///< mounted, unless a row says otherwise
        std::string_view expected;              ///< verify and repair disk, then permissions
        std::string_view because;
    };
    using Facts = testing::FakeFacts;
    const Facts whole{.type = 1};
    const Facts unverifiable{.verifies = false};
    const Facts locked{.writable = false};
    const Facts lostImage{.offlineImage = true};
    const auto decide = [this](const std::vector<Facts>& disks) {
        host.selection.clear();
        for (const Facts& facts : disks) {
            const auto disk = std::make_shared<FakeDisk>("x", facts);
            disk->mount = facts.mount ? std::nullopt : std::optional("/mnt");
            host.selection.push_back(disk);
        }
        module->selectionDidChange({OVDiskChangedNotification, nullptr, {}});
        const ButtonDecision decision = buttonDecision();
        EXPECT_TRUE(decision.showDetails);
        std::string text;
        for (const auto& [enabled, reason] :
             {decision.verifyDisk, decision.repairDisk, decision.verifyPermissions,
              decision.repairPermissions})
            text += (enabled ? " on" : " off") + std::to_string(reason);
        return text.substr(1);
    };
    for (const Case& c : {
             Case{{{}}, "on0 on0 on0 on0", "nothing stands against it"},
             Case{{whole}, "on0 on0 off0 off0", "a whole disk has no permissions, and no reason"},
             Case{{{.ownership = false}}, "on0 on0 off1 off1", "ignores ownership"},
             Case{{{.permissionsRepairable = false}}, "on0 on0 off2 off2", "no startup disk"},
             Case{{{.mount = "none", .ownership = false}}, "on0 on0 off8 off8", "not mounted"},
             Case{{{.repairs = false}}, "on0 off6 on0 on0", "cannot be repaired"},
             Case{{unverifiable}, "off7 on0 on0 on0", "cannot be verified"},
             Case{{{.writable = false,
             .offlineImage = true,
             .imagePath = "/i",
             .repairs = false,
             .verifies = false}},
                  "on0 on0 on0 on0",
                  "an image is judged when it is attached"},
             Case{{locked}, "on0 off9 on0 off9", "write-protected"},
             Case{{{.boot = true, .verifiesLive = true}}, "on0 off3 on0 on0", "verified live"},
             Case{{{.boot = true}}, "off0 off5 on0 on0", "no live verification"},
             Case{{{.home = true}}, "off0 off5 on0 on0", "home, not live"},
             Case{{{.boot = true, .home = true, .verifiesLive = true}},
                  "on0 off4 on0 on0",
                  "home, live: the later rule's reason stands"},
             Case{{unverifiable, whole}, "on7 on0 off0 off0", "a whole disk turns it on again"},
             Case{{whole, unverifiable}, "off7 on0 off0 off0", "and a later volume off"},
             Case{{lostImage, whole}, "off0 off0 off0 off0", "ends the walk: no next is asked"},
             Case{{locked, lostImage}, "off0 off9 off0 off9", "reasons stay as they were"},
         })
        EXPECT_EQ(decide(c.disks), c.expected) << c.because;
    host.canTreatPartitionMap = host.canTreatFilesystem = false;
    EXPECT_EQ(decide({{.type = 1}}), "off0 off0 off0 off0") << "nor a map to be treated";
    EXPECT_EQ(decide({{.repairs = false, .verifies = false}}), "on0 on0 on0 on0")
        << "the tool's NO leaves it to the start of the operation";
}

TEST_F(OVFXWTest, AButtonStopsItsOwnJobAndSaysSo)
{
    struct Case {
        FXWAction action;
        std::string_view button;
        std::string_view title;
        bool saysItCanBeStopped;
    };
    select(addDisk("a"));
    for (const Case& c :
         {Case{FXWActionVerifyDisk, "verifyDiskButton", "Stop Verify", true},
          Case{FXWActionVerifyPartitionMap, "verifyDiskButton", "Stop Verify", false},
          Case{FXWActionRepairDisk, "repairDiskButton", "Stop Repair", true},
          Case{FXWActionRepairPartitionMap, "repairDiskButton", "Stop Repair", false},
          Case{FXWActionVerifyPermissions, "verifyPermissionsButton", "Stop Permission Verify",
               true},
          Case{FXWActionRepairPermissions, "repairPermissionsButton", "Stop Permission Repair",
               true}}) {
        setAction(c.action);
        module->selectionDidChange({OVDiskChangedNotification, nullptr, {}});
        for (const char* name : {"verifyDiskButton", "repairDiskButton", "verifyPermissionsButton",
                                 "repairPermissionsButton"}) {
            EXPECT_EQ(button(name).enabled, c.button == name) << c.title;
            EXPECT_EQ(button(name).action == "stopAction:", c.button == name) << c.title;
        }
        EXPECT_EQ(button(c.button).title, c.title);
        EXPECT_EQ(button(c.button).toolTip == "This operation can be stopped",
                  c.saysItCanBeStopped);
        EXPECT_FALSE(button("clearHistoryButton").enabled);
    }
    setAction(77);
    module->selectionDidChange({OVDiskChangedNotification, nullptr, {}});
    EXPECT_TRUE(button("verifyDiskButton").enabled) << "an unknown action counts as idle";
}

TEST_F(OVFXWTest, ToolTipsExplainWhatIsNotAvailable)
{
    const auto disk = addDisk("a");
    disk->writable = false;
    select(disk);
    EXPECT_EQ(button("repairDiskButton").toolTip,
              "Repair the structure of the disk’s file system, if necessary");
    EXPECT_EQ(button("repairDiskButton").reason,
              "Not available because the selected disk can’t be written to.");
    EXPECT_EQ(button("verifyDiskButton").reason, "");
    select(addDisk("b"), disk);
    EXPECT_NE(button("repairDiskButton").reason.find("one of the selected disks"),
              std::string::npos);

    select();
    EXPECT_FALSE(button("verifyDiskButton").enabled);
    EXPECT_TRUE(button("showDetailsButton").enabled);
    EXPECT_EQ(button("repairDiskButton").reason, "");

    host.isMain = false;
    select(addDisk("c"));
    EXPECT_FALSE(button("showDetailsButton").enabled) << "the window is in the background";
    EXPECT_FALSE(host.outlinePeer.enabled);
    host.isMain = true;
    host.isLocked = true;
    select(addDisk("d"));
    EXPECT_FALSE(button("verifyDiskButton").enabled) << "the interface is locked";
    EXPECT_TRUE(button("showDetailsButton").enabled);
}

TEST_F(OVFXWTest, TheTabIsOfferedByTheKindOfDisk)
{
    for (std::int32_t type = -1; type <= 20; ++type) {
        const bool expected = type == 15 || type == 12 || type == 8 || (type >= 1 && type <= 6);
        EXPECT_EQ(module->displayPanelForDiskTypeAndDisk(type, addDisk("x")), expected) << type;
        EXPECT_EQ(module->supportsContextMenuForDiskTypeSelectedDisk(type, addDisk("x")), expected);
    }
    const auto optical = addDisk("sr0");
    optical->blankMedia = true;
    EXPECT_FALSE(module->displayPanelForDiskTypeAndDisk(15, optical));
    optical->dvdRAM = true;
    EXPECT_TRUE(module->displayPanelForDiskTypeAndDisk(15, optical));
    optical->dvdRAM = optical->blankMedia = false;
    optical->number = 1000000001;
    EXPECT_FALSE(module->displayPanelForDiskTypeAndDisk(15, optical));
}

// Before and beside the buttons: the module itself, and the disks that it is shown

TEST_F(OVFXWTest, SwitchDecidesWhetherTheModuleRuns)
{
    EXPECT_TRUE(OVFXW::shouldRunOnThisConfig(host, host)) << "without a switch";
    for (const bool isOn : {true, false}) {
        host.defaults["OVModule_FXW"] = isOn;
        EXPECT_EQ(OVFXW::shouldRunOnThisConfig(host, host), isOn);
    }
}

TEST_F(OVFXWTest, StartsFromThePreferencesWithAllActionsOff)
{
    host.showsDetails = true;
    makeModule();
    EXPECT_EQ(button(outlet::showDetails).value, 1);
    for (const std::string_view name : outlet::actions)
        EXPECT_FALSE(button(name).enabled) << name;
}

TEST_F(OVFXWTest, WorksWithoutItsInterfaceFile)
{
    host.hasInterfaceFile = false;
    makeModule();
    const auto disk = addDisk("a");
    verify(disk);
    finish(disk);
    EXPECT_TRUE(host.has("verify a"));
    EXPECT_TRUE(host.has("report"));
}

TEST_F(OVFXWTest, LeavesNothingOfItselfBehind)
{
    const auto disk = addDisk("a");
    host.images["/x.img"] = disk;
    verify(addImage("/x.img"));
    module.reset();
    EXPECT_TRUE(host.registrations.empty());
    EXPECT_EQ(host.outlineView->dataSource(), nullptr);
    for (const auto& worker : host.workers)
        worker();
    host.runTasks();  // an attachment that finishes late finds nobody, and harms nobody
    EXPECT_FALSE(host.has("verify a"));
}

// Selection

TEST_F(OVFXWTest, SelectionKeepsWhatCanBeTreated)
{
    const auto kept = addDisk("kept");
    const auto failing = addDisk("failing");
    failing->smartError = true;
    const auto parent = addDisk("parent");
    const auto snapshot = addDisk("snapshot");
    snapshot->type = 8;
    snapshot->parent = parent;
    const auto orphan = addDisk("orphan");
    orphan->type = 8;
    std::vector<OVDiskPointer> leftOut;
    for (const std::int32_t type : {2, 4, 15}) {
        leftOut.push_back(addDisk("type" + std::to_string(type)));
        std::static_pointer_cast<FakeDisk>(leftOut.back())->type = type;
    }
    select(leftOut[0], kept, failing, leftOut[1], snapshot, orphan, leftOut[2]);
    EXPECT_EQ(*module->selectionOfDisks(), (OVFXW::DiskList{kept, parent}));

    select(failing, leftOut[0]);
    ASSERT_TRUE(module->selectionOfDisks());
    EXPECT_TRUE(module->selectionOfDisks()->empty());
    EXPECT_FALSE(button("verifyDiskButton").enabled);
}

TEST_F(OVFXWTest, SelectionFollowsOnlyWhatConcernsTheTab)
{
    const auto disk = addDisk("a");
    const auto other = addDisk("b");
    host.isActive = false;
    select(disk);
    EXPECT_FALSE(module->selectionOfDisks()) << "another tab is shown";

    host.isActive = true;
    const int reloads = host.outlinePeer.reloads;
    const auto changed = [&](const std::shared_ptr<Object>& object) {
        const Notification notification{OVDiskChangedNotification, object, {}};
        module->diskChangedHandler(&notification);
        return module->selectionOfDisks() != nullptr;
    };
    EXPECT_FALSE(changed(disk)) << "no working disk";
    host.working = other;
    EXPECT_FALSE(changed(disk)) << "another disk than the working disk";
    EXPECT_FALSE(changed(nullptr));
    EXPECT_FALSE(changed(std::make_shared<Object>())) << "no disk";
    module->diskChangedHandler(nullptr);
    EXPECT_FALSE(module->selectionOfDisks());
    host.working = disk;
    EXPECT_TRUE(changed(disk));
    EXPECT_EQ(host.outlinePeer.reloads, reloads) << "the log is not reloaded here";

    module->windowChangedNotication({OVDiskChangedNotification, nullptr, {}});
    EXPECT_EQ(host.outlinePeer.reloads, reloads + 1);
}

}  // namespace fixwell
