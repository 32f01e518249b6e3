// SPDX-License-Identifier: Apache-2.0
#include "contract/toolkit/ControlNames.h"
#include "fixwell/module/OVFXW.h"

#include <array>

namespace fixwell {
namespace {

/// Puts the rules' questions to a disk and to the repair tool.
class HostDiskQuestions final : public DiskQuestions {
public:
    HostDiskQuestions(OVDiskPointer disk, PLRepairDisk& tool, std::function<bool()> canTreatMap)
        : disk_(std::move(disk)), tool_(tool), canTreatMap_(std::move(canTreatMap))
    {
    }

    std::int32_t diskType() const override { return disk_->diskType(); }
    bool canVerifyPartitionMap() const override { return canTreatMap_(); }
    bool canRepairPartitionMap() const override { return canTreatMap_(); }
    bool permissionsEnabled() const override { return disk_->permissionsEnabled(); }
    bool canRepairPermissions() const override { return disk_->canRepairPermissions(); }
    bool isMounted() const override { return disk_->isMounted(); }
    bool isWritableVolume() const override { return disk_->isWritableVolume(); }
    bool isBootVolume() const override { return disk_->isBootVolume(); }
    bool containUserHomeDirectory() const override { return disk_->containUserHomeDirectory(); }
    bool isOfflineDiskImage() const override { return disk_->isOfflineDiskImage(); }
    bool hasDiskImagePath() const override { return !disk_->diskImagePath().empty(); }
    bool filesystemCanBeRepaired() const override
    {
        const OVFilesystem* const filesystem = disk_->filesystem();
        return filesystem != nullptr && filesystem->canBeRepaired();
    }
    bool filesystemCanBeVerified() const override
    {
        const OVFilesystem* const filesystem = disk_->filesystem();
        return filesystem != nullptr && filesystem->canBeVerified();
    }
    bool supportsLiveVerify() const override
    {
        const OVFilesystem* const filesystem = disk_->filesystem();
        return filesystem != nullptr && filesystem->supportsLiveVerify();
    }
    bool toolCanRepair() const override
    {
        return tool_.canRepairStoragesystemFilesystemForDisk(disk_->theKRDisk(), nullptr);
    }
    bool toolCanVerify() const override
    {
        return tool_.canVerifyStoragesystemFilesystemForDisk(disk_->theKRDisk(), nullptr);
    }

private:
    OVDiskPointer disk_;
    PLRepairDisk& tool_;
    std::function<bool()> canTreatMap_;
};

/// What an action button says and does, at rest and while its own job runs.
struct ActionButtonTexts {
    std::string_view toolTip;
    std::string_view title;
    std::string_view stopTitle;
    Selector action;
    FXWAction runningCode;       ///< shows the stop tooltip
    FXWAction partitionMapCode;  ///< shows the stop title as well, but not the tooltip
};

constexpr std::array<ActionButtonTexts, 4> actionButtonTexts{{
    {localizable("Check whether the structure of the disk’s file system is OK"),
     localizable("Verify Disk"), localizable("Stop Verify"), selector::verifyDisk,
     FXWActionVerifyDisk, FXWActionVerifyPartitionMap},
    {localizable("Repair the structure of the disk’s file system, if necessary"),
     localizable("Repair Disk"), localizable("Stop Repair"), selector::repairDisk,
     FXWActionRepairDisk, FXWActionRepairPartitionMap},
    {localizable("Check whether the correct permissions are assigned to Tallo-installed files and "
                 "folders"),
     localizable("Verify Disk Permissions"), localizable("Stop Permission Verify"),
     selector::verifyPermissions, FXWActionVerifyPermissions, FXWActionVerifyPermissions},
    {localizable("Set the correct permissions for Tallo-installed files and folders"),
     localizable("Repair Disk Permissions"), localizable("Stop Permission Repair"),
     selector::repairPermissions, FXWActionRepairPermissions, FXWActionRepairPermissions},
}};

constexpr bool isKnownAction(std::int64_t action)
{
    return action >= FXWActionVerifyPermissions && action <= FXWActionRepairDisk;
}

}  // namespace

void OVFXW::enableButtons()
{
    applyDecision(decideButtons());
}

ButtonDecision OVFXW::decideButtons()
{
    const bool isWarningOpen = alertButtons.has_value();
    const bool isMain = utilityViewWindow().isMainWindow();
    if (isWarningOpen) {
        for (Button* button : *alertButtons)
            button->setEnabled(isMain);
        return decideNothing();
    }
    if (!isMain)
        return decideNothing();
    if (isKnownAction(action))
        return decideRunning(action);
    const auto selection = selectionOfDisks();
    if (windowController().interfaceLock() || !selection || selection->empty())
        return decideWithoutSelection();

    std::vector<std::unique_ptr<DiskQuestions>> questions;
    for (const OVDiskPointer& disk : *selection)
        questions.push_back(std::make_unique<HostDiskQuestions>(
            disk, repairDiskTool(), [this, disk] { return canVerifyPartitionMap(disk); }));
    return decideForSelection(questions, static_cast<bool>(allFsckHistoryOfSelection()));
}

void OVFXW::applyDecision(const ButtonDecision& decision)
{
    const std::array<Button*, 4> buttons{verifyDiskButton, repairDiskButton,
                                         verifyPermissionsButton, repairPermissionsButton};
    const std::array<ActionAvailability, 4> availability{decision.verifyDisk, decision.repairDisk,
                                                         decision.verifyPermissions,
                                                         decision.repairPermissions};
    const auto enable = [](Control* control, bool isEnabled) {
        if (control != nullptr)
            control->setEnabled(isEnabled);
    };
    for (std::size_t i = 0; i < buttons.size(); ++i)
        enable(buttons[i], availability[i].isEnabled);
    enable(clearHistoryButton, decision.clearHistory);
    enable(showDetailsButton, decision.showDetails);
    enable(messageOutlineView, decision.showDetails);

    const bool isMultiple = selectionOfDisks_ && selectionOfDisks_->size() > 1;
    for (std::size_t i = 0; i < buttons.size(); ++i) {
        if (buttons[i] == nullptr)
            continue;
        const ActionButtonTexts& texts = actionButtonTexts[i];
        const bool stops = action == texts.runningCode || action == texts.partitionMapCode;
        buttons[i]->setToolTip(localized(action == texts.runningCode
                                             ? localizable("This operation can be stopped")
                                             : texts.toolTip));
        buttons[i]->setReason(reasonString(availability[i].reason, isMultiple));
        buttons[i]->setAction(stops ? selector::stop : texts.action);
        buttons[i]->setTitle(localized(stops ? texts.stopTitle : texts.title));
    }
    for (View* view : std::array<View*, 7>{
             verifyDiskButton, repairDiskButton, verifyPermissionsButton, repairPermissionsButton,
             clearHistoryButton, showDetailsButton, messageOutlineView})
        if (view != nullptr)
            view->setNeedsDisplay(true);
}

std::string OVFXW::reasonString(std::int32_t reason, bool multiSelected) const
{
    const std::string_view text = reasonText(reason, multiSelected);
    return text.empty() ? std::string() : localized(text);
}

namespace {

constexpr std::int64_t placeholderDiskNumber = 1'000'000'001;

bool isOfferedForOptical(const OVDiskPointer& disk)
{
    if (!disk)
        return true;
    if (disk->isDVDRAM())
        return true;
    return !disk->hasBlankOpticalMedia() && disk->diskNumber() != placeholderDiskNumber;
}

}  // namespace

bool OVFXW::displayPanelForDiskTypeAndDisk(std::int32_t type, const OVDiskPointer& disk)
{
    switch (type) {
        case 1:
        case 2:
        case 3:
        case 4:
        case 5:
        case 6:
        case 8:
        case 12: return true;
        case 15: return isOfferedForOptical(disk);
        default: return false;
    }
}

bool OVFXW::supportsContextMenuForDiskTypeSelectedDisk(std::int32_t type, const OVDiskPointer& disk)
{
    return displayPanelForDiskTypeAndDisk(type, disk);
}

}  // namespace fixwell
