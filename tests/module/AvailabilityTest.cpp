// SPDX-License-Identifier: Apache-2.0
#include "tests/module/ModuleTest.h"

namespace fixwell {
namespace {

/// One disk's answers, in everything a sound, unmounted volume's until a test says otherwise.
struct Answers final : DiskQuestions {
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

    std::int32_t diskType() const override { return type; }
    bool canVerifyPartitionMap() const override { return map; }
    bool canRepairPartitionMap() const override { return map; }
    bool permissionsEnabled() const override { return ownership; }
    bool canRepairPermissions() const override { return permissions; }
    bool isMounted() const override { return mounted; }
    bool isWritableVolume() const override { return writable; }
    bool isBootVolume() const override { return boot; }
    bool containUserHomeDirectory() const override { return home; }
    bool isOfflineDiskImage() const override { return offline; }
    bool hasDiskImagePath() const override { return path; }
    bool filesystemCanBeRepaired() const override { return repairs; }
    bool filesystemCanBeVerified() const override { return verifies; }
    bool supportsLiveVerify() const override { return live; }
    bool toolCanRepair() const override { return tool; }
    bool toolCanVerify() const override { return tool; }
};

using Change = void (*)(Answers&);

std::string describe(const ButtonDecision& decision)
{
    std::string text;
    for (const auto& [enabled, reason] : {decision.verifyDisk, decision.repairDisk,
                                          decision.verifyPermissions, decision.repairPermissions})
        text += std::string(enabled ? "on" : "off") + std::to_string(reason) + " ";
    return text + (decision.showDetails ? "details" : "-");
}

std::string decide(std::initializer_list<Change> changes)
{
    std::vector<std::unique_ptr<DiskQuestions>> selection;
    for (const Change change : changes) {
        auto answers = std::make_unique<Answers>();
        change(*answers);
        selection.push_back(std::move(answers));
    }
    return describe(decideForSelection(selection, false));
}

constexpr Change sound = [](Answers&) {
};
constexpr Change unverifiable = [](Answers& a) {
    a.verifies = false;
};
constexpr Change whole = [](Answers& a) {
    a.type = 1;
};
constexpr Change wholeWithoutMap = [](Answers& a) {
    a.type = 1, a.map = false;
};
constexpr Change lostImage = [](Answers& a) {
    a.offline = true, a.path = false;
};

}  // namespace

// The four words are verify disk, repair disk, verify permissions, repair permissions, each with
// its reason.
TEST(ButtonDecision, FollowsTheRulesDiskByDisk)
{
    struct Case {
        std::initializer_list<Change> disks;
        std::string_view expected;
        std::string_view because;
    };
    const Case cases[] = {
        {{sound}, "on0 on0 on0 on0 details", "nothing stands against it"},
        {{whole}, "on0 on0 off0 off0 details", "a whole disk has no permissions, and no reason"},
        {{wholeWithoutMap}, "off0 off0 off0 off0 details", "nor a map that can be treated"},
        {{[](Answers& a) {
             a.ownership = false;
         }},
         "on0 on0 off1 off1 details",
         "ignores ownership"},
        {{[](Answers& a) {
             a.permissions = false;
         }},
         "on0 on0 off2 off2 details",
         "no startup disk"},
        {{[](Answers& a) {
             a.ownership = a.mounted = false;
         }},
         "on0 on0 off8 off8 details",
         "not mounted"},
        {{[](Answers& a) {
             a.repairs = false;
         }},
         "on0 off6 on0 on0 details",
         "cannot be repaired"},
        {{unverifiable}, "off7 on0 on0 on0 details", "cannot be verified"},
        {{[](Answers& a) {
             a.repairs = a.verifies = a.tool = false;
         }},
         "on0 on0 on0 on0 details",
         "the tool's NO leaves it to the start of the operation"},
        {{[](Answers& a) {
             a.repairs = a.verifies = a.writable = false, a.offline = true;
         }},
         "on0 on0 on0 on0 details",
         "an image is judged when it is attached"},
        {{[](Answers& a) {
             a.writable = false;
         }},
         "on0 off9 on0 off9 details",
         "write-protected"},
        {{[](Answers& a) {
             a.boot = a.live = true;
         }},
         "on0 off3 on0 on0 details",
         "verified live"},
        {{[](Answers& a) {
             a.boot = true;
         }},
         "off0 off5 on0 on0 details",
         "no live verification"},
        {{[](Answers& a) {
             a.home = a.live = true;
         }},
         "on0 off4 on0 on0 details",
         "home, live"},
        {{[](Answers& a) {
             a.home = true;
         }},
         "off0 off5 on0 on0 details",
         "home, not live"},
        {{[](Answers& a) {
             a.boot = a.home = a.live = true;
         }},
         "on0 off4 on0 on0 details",
         "the later rule's reason stands"},
        {{unverifiable, whole}, "on7 on0 off0 off0 details", "a whole disk turns it on again"},
        {{whole, unverifiable}, "off7 on0 off0 off0 details", "and a later volume off"},
        {{lostImage, whole}, "off0 off0 off0 off0 details", "ends the walk: the next is not asked"},
        {{[](Answers& a) { a.writable = false; }, lostImage},
         "off0 off9 off0 off9 details",
         "reasons stay as they were"},
    };
    for (const Case& c : cases)
        EXPECT_EQ(decide(c.disks), c.expected) << c.because;
}

TEST_F(OVFXWTest, ReasonsAreSentencesForOneAndForSeveral)
{
    EXPECT_EQ(reason(0, false), "");
    EXPECT_EQ(reason(-1, true), "");
    EXPECT_EQ(reason(10, true), "");
    EXPECT_EQ(reason(3, true), "Not available because the startup disk is selected.");
    EXPECT_EQ(reason(7, false), "Not available for the selected disk.");
    EXPECT_EQ(reason(5, true), "Not available for one or more of the selected disks.");
    EXPECT_EQ(reason(9, false), "Not available because the selected disk can’t be written to.");
    for (int code = 1; code <= 9; ++code)
        EXPECT_NE(reason(code, true), "") << code;
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
    EXPECT_EQ(button("verifyDiskButton").toolTip,
              "Check whether the structure of the disk’s file system is OK");
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
