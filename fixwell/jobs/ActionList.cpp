// SPDX-License-Identifier: Apache-2.0
#include "fixwell/jobs/ActionListEntry.h"
#include "fixwell/module/OVFXW.h"

#include <algorithm>

namespace fixwell {
namespace {

constexpr std::int64_t verifyTag = 1000;
constexpr std::int64_t cancelTag = 1001;

}  // namespace

void OVFXW::verifyDisk(const void* /*sender*/)
{
    buildActionList(FXWActionVerifyDisk);
    if (_deferredDisksNotYetAttached != 0)
        return;
    if (actionListContainsBootPartition())
        showStartupDiskWarning();
    else
        processActionList();
    enableButtons();
}

void OVFXW::repairDisk(const void* /*sender*/)
{
    startAction(FXWActionRepairDisk);
}

void OVFXW::verifyPermissions(const void* /*sender*/)
{
    startAction(FXWActionVerifyPermissions);
}

void OVFXW::repairPermissions(const void* /*sender*/)
{
    startAction(FXWActionRepairPermissions);
}

void OVFXW::startAction(FXWAction requested)
{
    buildActionList(requested);
    if (_deferredDisksNotYetAttached == 0)
        processActionList();
}

void OVFXW::buildActionList(FXWAction requested)
{
    clearActionList();
    setActionList(Array::make());
    _deferredDisks.clear();
    _deferredActionType = requested;
    _timeEstimator = host().makeTimeEstimator();
    host().mainRunLoop().performOnMainThread([this] { clearMessageText(); },
                                             RunLoop::Wait::UntilDone);
    queueSelection(requested);
    // The question comes before anything runs: also before an image is attached.
    if (requested == FXWActionVerifyDisk && actionListContainsBootPartition()) {
        enableButtons();
        return;
    }
    startRunningState(requested);
    attachSelectedImages();
    enableButtons();
}

void OVFXW::queueSelection(FXWAction requested)
{
    const auto selection = selectionOfDisks();
    if (!selection)
        return;
    for (const OVDiskPointer& disk : *selection) {
        if (disk->diskType() == OVDisk::typeDiskImage)
            imagesToAttach_.push_back(disk);
        else if (diskNotInActionList(disk))
            queueDisk(disk, requested);
    }
}

void OVFXW::queueDisk(const OVDiskPointer& disk, FXWAction requested)
{
    if (!disk->isWhole())
        addDiskToActionList(disk, requested);
    else if (requested == FXWActionVerifyDisk && canVerifyPartitionMap(disk))
        addDiskToActionList(disk, FXWActionVerifyPartitionMap);
    else if (requested == FXWActionRepairDisk && canRepairPartitionMap(disk))
        addDiskToActionList(disk, FXWActionRepairPartitionMap);
}

void OVFXW::startRunningState(FXWAction requested)
{
    totalActionsInJob = static_cast<std::int64_t>(actionList_.size());
    currentJob = 0;
    lineCount = 0;
    action = requested;
    setRunning(true);
}

void OVFXW::addDiskToActionList(const OVDiskPointer& disk, FXWAction requested)
{
    if (!actionList_)
        setActionList(Array::make());
    actionList_.append(makeActionListEntry(disk, requested));
}

bool OVFXW::diskNotInActionList(const OVDiskPointer& disk) const
{
    const std::string identifier = disk->diskIdentifier();
    const auto& entries = actionList_.values();
    return std::none_of(entries.begin(), entries.end(), [&identifier](const Value& entry) {
        const OVDiskPointer queued = diskOfEntry(entry.dictionary());
        return queued && queued->diskIdentifier() == identifier;
    });
}

bool OVFXW::actionListContainsBootPartition() const
{
    if ((host().events().currentModifierFlags() & modifierOption) != 0)
        return false;
    const auto& entries = actionList_.values();
    return std::any_of(entries.begin(), entries.end(), [this](const Value& entry) {
        const OVDiskPointer disk =
            diskController().diskWithIdentifier(entry.dictionary().string(kEntryDiskIdentifier));
        return disk && disk->isBootVolume();
    });
}

void OVFXW::showStartupDiskWarning()
{
    Alert::Text text;
    text.message = localized(localizable(
        "Your computer may be slow or unresponsive while the startup disk is being verified."));
    text.informative = localized(
        localizable("The progress indicator and status messages may not be updated until the "
                    "verification process is complete."));
    text.defaultButton = localized(localizable("Verify Disk"));
    text.alternateButton = host().hostBundle().localizedString("Cancel");
    startupDiskWarning_ = host().alerts().makeAlert(text);

    alertButtons = startupDiskWarning_->buttons();
    if (alertButtons->size() >= 2) {
        Button& verify = *alertButtons->at(0);
        verify.setKeyEquivalent("");
        verify.setTag(verifyTag);
        // Return cancels: nobody starts a slow check of the startup disk by habit.
        Button& cancel = *alertButtons->at(1);
        cancel.setKeyEquivalent("\r");
        cancel.setTag(cancelTag);
    }
    startupDiskWarning_->beginSheetModalForWindow(
        &utilityViewWindow(), [module = liveness_](Alert& alert, long returnCode) {
            if (*module != nullptr)
                (*module)->alertDidEnd(alert, returnCode);
        });
}

void OVFXW::alertDidEnd(Alert& alert, long returnCode)
{
    const std::shared_ptr<Alert> kept = std::move(startupDiskWarning_);
    alertButtons.reset();
    if (returnCode == verifyTag) {
        alert.orderOut();
        startRunningState(FXWActionVerifyDisk);
        attachSelectedImages();
        if (_deferredDisksNotYetAttached == 0)
            processActionList();
    } else {
        clearActionList();
    }
    enableButtons();
}

void OVFXW::clearActionList()
{
    setActionList({});
    if (completedList)
        completedList.removeAll();
    inflightItem = {};
    imagesToAttach_.clear();
    _deferredDisksNotYetAttached = 0;
}

}  // namespace fixwell
