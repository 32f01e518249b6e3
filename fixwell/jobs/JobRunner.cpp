// SPDX-License-Identifier: Apache-2.0
#include "fixwell/jobs/ActionListEntry.h"
#include "fixwell/module/OVFXW.h"

#include <array>

namespace fixwell {

// A launcher that cannot start its operation leaves nothing running, so the next entry follows
// at once: one bad disk never stalls the job.
void OVFXW::processActionList()
{
    while (!actionList_.isEmpty()) {
        inflightItem = takeFrontEntry();
        ++currentJob;
        if (launchEntry(inflightItem))
            return;
    }
    displaySummary();
    sendCompletionReport(nullptr);
    postWarnings();
    doneWithActivity();
}

Dictionary OVFXW::takeFrontEntry()
{
    const Dictionary entry = actionList_.front().dictionary();
    actionList_.removeFront();
    return entry;
}

OVDiskPointer OVFXW::findDiskOfEntry(const Dictionary& entry) const
{
    if (const OVDiskPointer disk = diskOfEntry(entry))
        return disk;
    return diskController().diskWithIdentifier(entry.string(kEntryDiskIdentifier));
}

bool OVFXW::launchEntry(const Dictionary& entry)
{
    const std::int64_t code = entry.integer(kEntryAction);
    const OVDiskPointer disk = findDiskOfEntry(entry);
    if (code < FXWActionVerifyPermissions || code > FXWActionRepairDisk)
        return false;
    action = code;
    switch (code) {
        case FXWActionVerifyPermissions: return doVerifyPermissions(disk) == 0;
        case FXWActionRepairPermissions: return doRepairPermissions(disk) == 0;
        case FXWActionVerifyPartitionMap: return doVerifyPartitionMap(disk) == 0;
        case FXWActionRepairPartitionMap: return doRepairPartitionMap(disk) == 0;
        case FXWActionVerifyDisk: return doVerifyDisk(disk) == 0;
        default: return doRepairDisk(disk) == 0;
    }
}

void OVFXW::setRunning(bool isRunning)
{
    OVWindowController& window = windowController();
    constexpr std::size_t withheldCount = 3;
    const std::array<Name, withheldCount> withheld{
        OVDiskAppearedNotification, OVDiskUnmountedNotification, OVDiskChangedNotification};
    if (isRunning) {
        _jobStarted = false;
        window.setInterfaceLock();
        for (const Name name : withheld)
            host().defaultCenter().removeObserver(this, name);
        window.setGlobalProgressBarValue(0.0);
        window.setGlobalProgressText("");
        window.activateGlobalProgressBar(true);
        window.activateGlobalProgressText(true);
        window.setGlobalProgressBarIndeterminate(true);
        window.startGlobalProgressBarAnimation(this);
        return;
    }
    window.resetInterfaceLock();
    window.activateGlobalProgressBar(false);
    window.activateGlobalProgressText(false);
    action = FXWActionNone;
    for (const Name name : withheld)
        observeDiskNotification(name);
}

void OVFXW::doneWithActivity()
{
    windowController().setGlobalProgressBarValue(100.0);
    stopRunTimer();
    clearDeferredDisks();
    clearActionList();
    setRunning(false);
    enableButtons();
}

void OVFXW::stopAction(const void* /*sender*/)
{
    for (Button* button :
         {verifyDiskButton, repairDiskButton, verifyPermissionsButton, repairPermissionsButton}) {
        if (button == nullptr)
            continue;
        button->setEnabled(false);
        button->setNeedsDisplay(true);
    }
    appendErrorTitleToMessageText(format("%@\n", {localized(localizable("Stopped by user"))}));
    if (inflightItem)
        inflightItem.set(kEntryStoppedByUser, true);
    stopRunTimer();
    _stoppedByUser = true;
    for (const Value& entry : actionList_.values())
        addDiskToCompletedList(entry.dictionary());
    setActionList({});
    repairDiskTool().cancelCurrentOperation();
}

void OVFXW::addDiskToCompletedList(const Dictionary& entry)
{
    if (!completedList)
        completedList = Array::make();
    completedList.append(entry);
}

OVDiskPointer OVFXW::searchForInflightDisk() const
{
    if (inflightItem)
        return diskOfEntry(inflightItem);
    if (const OVDiskPointer disk = diskOfEntry(completedList.back().dictionary()))
        return disk;
    return diskOfEntry(actionList_.front().dictionary());
}

void OVFXW::simulateActionList()
{
    if (actionList_.isEmpty())
        return;
    inflightItem = takeFrontEntry();
    const OVDiskPointer disk = findDiskOfEntry(inflightItem);
    const std::string title = localizedFormat(localizable("Fake Verify permissions for \"%@\""),
                                              disk ? disk->displayName() : std::string());
    ov_log(OVLog::trace, "%@\n", title);
    windowController().setGlobalProgressText(title);
    createStartupObject(title, disk);
}

}  // namespace fixwell
