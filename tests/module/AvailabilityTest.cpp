// SPDX-License-Identifier: Apache-2.0
#include "tests/module/ModuleTest.h"

namespace fixwell {
namespace {

/// What one disk answers: in everything what a sound, mounted volume does, until a row of the
/// table says otherwise.
struct Facts {
    std::int32_t type = 3;
    bool map = true;
    bool ownership = true;
    bool permissions = true;
    bool mounted = true;
    bool writable = true;
    bool boot = false;
    bool home = false;
    bool offline = false;
    bool path = true;
    bool repairs = true;
    bool verifies = true;
    bool live = false;
    bool tool = true;
};

struct Answers final : DiskQuestions {
    explicit Answers(const Facts& facts) : is(facts) {}

    std::int32_t diskType() const override { return is.type; }
    bool canVerifyPartitionMap() const override { return is.map; }
    bool canRepairPartitionMap() const override { return is.map; }
    bool permissionsEnabled() const override { return is.ownership; }
    bool canRepairPermissions() const override { return is.permissions; }
    bool isMounted() const override { return is.mounted; }
    bool isWritableVolume() const override { return is.writable; }
    bool isBootVolume() const override { return is.boot; }
    bool containUserHomeDirectory() const override { return is.home; }
    bool isOfflineDiskImage() const override { return is.offline; }
    bool hasDiskImagePath() const override { return is.path; }
    bool filesystemCanBeRepaired() const override { return is.repairs; }
    bool filesystemCanBeVerified() const override { return is.verifies; }
    bool supportsLiveVerify() const override { return is.live; }
    bool toolCanRepair() const override { return is.tool; }
    bool toolCanVerify() const override { return is.tool; }

    Facts is;
};

/// Verify disk, repair disk, verify permissions, repair permissions, each with its reason.
std::string decide(const std::vector<Facts>& disks)
{
    std::vector<std::unique_ptr<DiskQuestions>> selection;
    for (const Facts& disk : disks)
        selection.push_back(std::make_unique<Answers>(disk));
    const ButtonDecision decision = decideForSelection(selection, false);
    EXPECT_TRUE(decision.showDetails);
    std::string text;
    for (const auto& [enabled, reason] : {decision.verifyDisk, decision.repairDisk,
                                          decision.verifyPermissions, decision.repairPermissions})
        text += (enabled ? " on" : " off") + std::to_string(reason);
    return text.substr(1);
}

}  // namespace

TEST(ButtonDecision, FollowsTheRulesDiskByDisk)
{
    struct Case {
        std::vector<Facts> disks;
        std::string_view expected;
        std::string_view because;
    };
    const Facts whole{.type = 1};
    const Facts unverifiable{.verifies = false};
    const Facts locked{.writable = false};
    const Facts lostImage{.offline = true, .path = false};
    for (const Case& c : {
             Case{{{}}, "on0 on0 on0 on0", "nothing stands against it"},
             Case{{whole}, "on0 on0 off0 off0", "a whole disk has no permissions, and no reason"},
             Case{{{.type = 1, .map = false}}, "off0 off0 off0 off0", "nor a map to be treated"},
             Case{{{.ownership = false}}, "on0 on0 off1 off1", "ignores ownership"},
             Case{{{.permissions = false}}, "on0 on0 off2 off2", "no startup disk"},
             Case{{{.ownership = false, .mounted = false}}, "on0 on0 off8 off8", "not mounted"},
             Case{{{.repairs = false}}, "on0 off6 on0 on0", "cannot be repaired"},
             Case{{unverifiable}, "off7 on0 on0 on0", "cannot be verified"},
             Case{{{.repairs = false, .verifies = false, .tool = false}},
                  "on0 on0 on0 on0",
                  "the tool's NO leaves it to the start of the operation"},
             Case{{{.writable = false, .offline = true, .repairs = false, .verifies = false}},
                  "on0 on0 on0 on0",
                  "an image is judged when it is attached"},
             Case{{locked}, "on0 off9 on0 off9", "write-protected"},
             Case{{{.boot = true, .live = true}}, "on0 off3 on0 on0", "verified live"},
             Case{{{.boot = true}}, "off0 off5 on0 on0", "no live verification"},
             Case{{{.home = true}}, "off0 off5 on0 on0", "home, not live"},
             Case{{{.boot = true, .home = true, .live = true}},
                  "on0 off4 on0 on0",
                  "home, live: the later rule's reason stands"},
             Case{{unverifiable, whole}, "on7 on0 off0 off0", "a whole disk turns it on again"},
             Case{{whole, unverifiable}, "off7 on0 off0 off0", "and a later volume off"},
             Case{{lostImage, whole}, "off0 off0 off0 off0", "ends the walk: no next is asked"},
             Case{{locked, lostImage}, "off0 off9 off0 off9", "reasons stay as they were"},
         })
        EXPECT_EQ(decide(c.disks), c.expected) << c.because;
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

}  // namespace fixwell
