// SPDX-License-Identifier: Apache-2.0
#include "contract/toolkit/ControlNames.h"
#include "tests/module/ModuleTest.h"

namespace fixwell {

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
