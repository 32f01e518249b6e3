// SPDX-License-Identifier: Apache-2.0
#include "fixwell/availability/ButtonDecision.h"

#include "contract/foundation/Bundle.h"
#include "contract/support/OVDisk.h"
#include "fixwell/jobs/ActionListEntry.h"

#include <array>

namespace fixwell {
namespace {

void disable(ActionAvailability& action)
{
    action.isEnabled = false;
}

void disable(ActionAvailability& action, FXWReason reason)
{
    action = {false, reason};
}

void applyWholeDiskRule(ButtonDecision& decision, const DiskQuestions& disk)
{
    decision.verifyDisk.isEnabled = disk.canVerifyPartitionMap();
    decision.repairDisk.isEnabled = disk.canRepairPartitionMap();
    disable(decision.verifyPermissions);
    disable(decision.repairPermissions);
}

void applyPermissionRule(ButtonDecision& decision, const DiskQuestions& disk)
{
    if (disk.permissionsEnabled() && disk.canRepairPermissions())
        return;
    const auto because = [&decision](FXWReason reason) {
        decision.verifyPermissions.reason = reason;
        decision.repairPermissions.reason = reason;
    };
    disable(decision.verifyPermissions);
    disable(decision.repairPermissions);
    if (!disk.isMounted())
        because(FXWReasonNotMounted);
    else if (!disk.permissionsEnabled())
        because(FXWReasonIgnoresOwnership);
    else if (!disk.canRepairPermissions())
        because(FXWReasonNotStartupDisk);
}

void applyFilesystemRules(ButtonDecision& decision, const DiskQuestions& disk)
{
    if (!disk.filesystemCanBeRepaired() && disk.toolCanRepair() && !disk.isOfflineDiskImage())
        disable(decision.repairDisk, FXWReasonCannotRepair);
    if (!disk.filesystemCanBeVerified() && disk.toolCanVerify() && !disk.isOfflineDiskImage())
        disable(decision.verifyDisk, FXWReasonCannotVerify);
}

void applyWritableRule(ButtonDecision& decision, const DiskQuestions& disk)
{
    if (disk.isWritableVolume() || disk.isOfflineDiskImage())
        return;
    disable(decision.repairDisk, FXWReasonNotWritable);
    disable(decision.repairPermissions, FXWReasonNotWritable);
}

/// A volume that cannot be unmounted: at best it is verified live, and never repaired.
void applyInUse(ButtonDecision& decision, bool canVerifyLive, FXWReason whyNoRepair)
{
    if (canVerifyLive) {
        disable(decision.repairDisk, whyNoRepair);
        return;
    }
    disable(decision.verifyDisk);
    disable(decision.repairDisk, FXWReasonLiveCheckUnavailable);
}

void applyInUseRules(ButtonDecision& decision, const DiskQuestions& disk)
{
    if (disk.isBootVolume())
        applyInUse(decision, disk.supportsLiveVerify() && disk.toolCanRepair(),
                   FXWReasonStartupDiskSelected);
    if (disk.containUserHomeDirectory())
        applyInUse(decision, disk.supportsLiveVerify() && disk.toolCanVerify(),
                   FXWReasonHomeDirectory);
}

/// NO when the disk makes every action impossible, whatever else is selected.
bool applyRules(ButtonDecision& decision, const DiskQuestions& disk)
{
    if (disk.diskType() == OVDisk::typeWhole) {
        applyWholeDiskRule(decision, disk);
        return true;
    }
    applyPermissionRule(decision, disk);
    applyFilesystemRules(decision, disk);
    applyWritableRule(decision, disk);
    applyInUseRules(decision, disk);
    return !disk.isOfflineDiskImage() || disk.hasDiskImagePath();
}

void disableActions(ButtonDecision& decision)
{
    for (ActionAvailability* action : {&decision.verifyDisk, &decision.repairDisk,
                                       &decision.verifyPermissions, &decision.repairPermissions})
        disable(*action);
}

}  // namespace

ButtonDecision decideNothing()
{
    return {};
}

ButtonDecision decideRunning(std::int64_t action)
{
    ButtonDecision decision;
    decision.showDetails = true;
    decision.verifyDisk.isEnabled =
        action == FXWActionVerifyPartitionMap || action == FXWActionVerifyDisk;
    decision.repairDisk.isEnabled =
        action == FXWActionRepairPartitionMap || action == FXWActionRepairDisk;
    decision.verifyPermissions.isEnabled = action == FXWActionVerifyPermissions;
    decision.repairPermissions.isEnabled = action == FXWActionRepairPermissions;
    return decision;
}

ButtonDecision decideWithoutSelection()
{
    ButtonDecision decision;
    decision.showDetails = true;
    return decision;
}

ButtonDecision decideForSelection(const std::vector<std::unique_ptr<DiskQuestions>>& selection,
                                  bool hasHistory)
{
    ButtonDecision decision;
    decision.clearHistory = hasHistory;
    decision.showDetails = true;
    decision.verifyDisk.isEnabled = true;
    decision.repairDisk.isEnabled = true;
    decision.verifyPermissions.isEnabled = true;
    decision.repairPermissions.isEnabled = true;
    for (const auto& disk : selection) {
        if (!applyRules(decision, *disk)) {
            disableActions(decision);
            break;
        }
    }
    return decision;
}

namespace {

struct Sentence {
    std::string_view single;
    std::string_view multiple;
};

constexpr Sentence startupDisk{
    localizable("Not available because the startup disk is selected."),
    localizable("Not available because the startup disk is selected."),
};
constexpr Sentence general{
    localizable("Not available for the selected disk."),
    localizable("Not available for one or more of the selected disks."),
};

// By reason, from 1 on.
constexpr std::array<Sentence, 9> sentences{{
    {localizable("Not available because the selected disk is set to ignore ownership."),
     localizable("Not available because one of the selected disks is set to ignore ownership.")},
    {localizable("Not available because the selected disk isn’t a startup disk."),
     localizable("Not available because one of the selected disks isn’t a startup disk.")},
    startupDisk,
    {localizable("Not available because the selected disk contains your home directory and "
                 "can’t be unmounted."),
     localizable("Not available because one of the selected disks contains your home directory "
                 "and can’t be unmounted.")},
    general,
    general,
    general,
    {localizable("Not available because the selected disk is not mounted."),
     localizable("Not available because one of the selected disks is not mounted.")},
    {localizable("Not available because the selected disk can’t be written to."),
     localizable("Not available because one of the selected disks can’t be written to.")},
}};

}  // namespace

std::string_view reasonText(std::int32_t reason, bool isMultiple)
{
    if (reason < FXWReasonIgnoresOwnership || reason > FXWReasonNotWritable)
        return {};
    const Sentence& sentence = sentences[static_cast<std::size_t>(reason - 1)];
    return isMultiple ? sentence.multiple : sentence.single;
}

}  // namespace fixwell
