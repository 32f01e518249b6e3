// SPDX-License-Identifier: Apache-2.0
#include "fixwell/history/CompletionReport.h"
#include "fixwell/module/OVFXW.h"

#include <algorithm>

namespace fixwell {

Array OVFXW::allFsckHistoryOfSelection() const
{
    if (selectionOfDisks_ && selectionOfDisks_->size() == 1)
        return selectionOfDisks_->front()->fsckHistory();
    const Array all = Array::make();
    for (const Array& history : historiesOfSelection())
        all.append(history);
    return all.isEmpty() ? Array() : all;
}

std::vector<Array> OVFXW::historiesOfSelection() const
{
    if (!selectionOfDisks_)
        return {};
    DiskList taken;
    const auto isTaken = [&taken](const OVDiskPointer& disk) {
        return disk && std::any_of(taken.begin(), taken.end(), [&disk](const OVDiskPointer& other) {
                   return other->isEqual(*disk);
               });
    };
    std::vector<Array> histories;
    for (const OVDiskPointer& disk : *selectionOfDisks_) {
        if (isTaken(disk) || isTaken(disk->parentDisk()))
            continue;
        taken.push_back(disk);
        histories.push_back(disk->fsckHistory());
    }
    return histories;
}

void OVFXW::createDiskSummaryRecord()
{
    const OVDiskPointer disk = searchForInflightDisk();
    if (!disk)
        return;
    const Array history = disk->fsckHistoryNoChildren();
    if (!history)
        return;
    const Dictionary summary = makeSummaryRecord(history);
    addObjectAndUpdateView(history, summary, true);
    notifyDiskChanged(disk);
    ov_log(OVLog::trace, "repairFinishedForDisk for %@ with repair summary: %@\n",
           disk->displayName(), [&summary] { return Value(summary).description(); });
}

void OVFXW::notifyDiskChanged(const OVDiskPointer& disk)
{
    diskController().notifyFrontmostModulesOnly(OVDiskChangedNotification,
                                                {OVDiskChangedNotification, disk, {}});
}

void OVFXW::displaySummary()
{
    if (action == FXWActionRepairPermissions)
        repairPermissionsSummary();
    else if (action == FXWActionVerifyPermissions)
        verifyPermissionsSummary();
    host().log().log("\n");
}

void OVFXW::verifyPermissionsSummary()
{
    appendTitleToMessageText(
        format("%@\n", {localized(localizable("Permissions verification complete"))}));
    createDiskSummaryRecord();
}

void OVFXW::repairPermissionsSummary()
{
    appendTitleToMessageText(
        format("%@\n", {localized(localizable("Permissions repair complete"))}));
    createDiskSummaryRecord();
}

void OVFXW::clearHistoryAction(const void* /*sender*/)
{
    DiskList cleared;
    if (selectionOfDisks_)
        for (const OVDiskPointer& disk : *selectionOfDisks_)
            if (disk->clearFsckHistory())
                cleared.push_back(disk);
    for (const OVDiskPointer& disk : cleared)
        notifyDiskChanged(disk);
    reloadMessageView();
    enableButtons();
}

void OVFXW::sendCompletionReport(const void* /*ignored*/)
{
    windowController().notifyWindowOfCompletion(makeCompletionReport(completedList));
}

void OVFXW::postWarnings()
{
    if (const auto warning = warningToPost(completedList))
        simpleModuleAlert(warning->title, warning->message, 0);
}

std::string OVFXW::actionDescription() const
{
    switch (action) {
        case FXWActionVerifyPermissions:
            return localized(localizable("Orvane stopped verifying permissions on “%@”"));
        case FXWActionRepairPermissions:
            return localized(localizable("Orvane stopped repairing permissions on “%@”"));
        case FXWActionVerifyDisk: return localized(localizable("Orvane stopped verifying “%@”"));
        case FXWActionRepairDisk: return localized(localizable("Orvane stopped repairing “%@”"));
        default: return {};
    }
}

}  // namespace fixwell
