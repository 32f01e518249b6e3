// SPDX-License-Identifier: Apache-2.0
#include "fixwell/module/OVFXW.h"

#include <array>

namespace fixwell {
namespace {

constexpr std::int32_t typeStandingForParent = 8;

bool isLeftOut(const OVDisk& disk)
{
    if (disk.hasSMARTError())
        return true;
    const std::int32_t type = disk.diskType();
    return type == 2 || type == 4 || type == 15;
}

}  // namespace

void OVFXW::selectionDidChange(const Notification& /*notification*/)
{
    takeUpSelection();
}

void OVFXW::windowChangedNotication(const Notification& /*notification*/)
{
    takeUpSelection();
}

void OVFXW::takeUpSelection()
{
    if (!currentActiveTab())
        return;
    createWorkingList();
    enableButtons();
    reloadMessageView();
}

void OVFXW::diskChangedHandler(const Notification* notification)
{
    if (!currentActiveTab() || notification == nullptr)
        return;
    const auto disk = std::dynamic_pointer_cast<OVDisk>(notification->object);
    const OVDiskPointer working = workingDisk();
    if (!disk || !working || disk->diskIdentifier() != working->diskIdentifier())
        return;
    createWorkingList();
    enableButtons();
}

void OVFXW::createWorkingList()
{
    auto kept = std::make_shared<DiskList>();
    for (const OVDiskPointer& disk :
         windowController().allSelectedItemsFilterDuplicates(false, true)) {
        if (isLeftOut(*disk))
            continue;
        if (disk->diskType() != typeStandingForParent)
            kept->push_back(disk);
        else if (const OVDiskPointer parent = disk->parentDisk())
            kept->push_back(parent);
    }
    setSelectionOfDisks(std::move(kept));
}

void OVFXW::setSelectionOfDisks(std::shared_ptr<const DiskList> disks)
{
    selectionOfDisks_ = std::move(disks);
}

}  // namespace fixwell
