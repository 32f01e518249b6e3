// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/KeptRepairs.h"

#include <unistd.h>

namespace orvane::desktop {
namespace {

const Disk* subjectIn(const Disk& disk)
{
    return disk.isOfflineDiskImage() ? disk.contents().get() : &disk;
}

/// Whether a job that writes to it runs with an administrator's rights, who keep their own records.
bool needsRights(const Disk& disk)
{
    return ::geteuid() != 0 &&
           disk.facts().storage == contract::DiskReference::Storage::BlockDevice &&
           (disk.isMounted() || ::access(disk.facts().path.c_str(), R_OK | W_OK) != 0);
}

std::string_view reasonAgainst(pellar::Operation operation, KeptRepair kept)
{
    switch (kept) {
        case KeptRepair::None: return "No repair of this disk is kept.";
        case KeptRepair::InUse: return "A program works on the last repair of this disk.";
        case KeptRepair::Applied:
            return operation == pellar::Operation::Finish
                       ? "The last repair of this disk was not interrupted."
                       : "";
        case KeptRepair::Interrupted:
        case KeptRepair::Unknown: break;
    }
    return {};
}

}  // namespace

std::string_view reasonAgainst(pellar::Operation operation, const UndoSituation& situation)
{
    if (situation.isLocked)
        return "Not available while a job runs.";
    if (situation.selectedDisks == 0)
        return "Select a disk first.";
    if (situation.selectedDisks > 1)
        return "Select one disk alone.";
    return situation.isThere ? reasonAgainst(operation, situation.kept)
                             : "Not available for this disk.";
}

const pellar::ListedRecord* KeptRepairs::newestOf(const Disk& disk) const
{
    const Disk* const subject = subjectIn(disk);
    return subject != nullptr ? records_.newestOf(subject->facts()) : nullptr;
}

KeptRepair KeptRepairs::stateOf(const Disk& disk) const
{
    const pellar::ListedRecord* const record = newestOf(disk);
    if (record == nullptr)
        return needsRights(disk) ? KeptRepair::Unknown : KeptRepair::None;
    if (record->isInUse)
        return KeptRepair::InUse;
    return record->isInterrupted() ? KeptRepair::Interrupted : KeptRepair::Applied;
}

// Asked for every row of the list: where nothing is interrupted, no disk's name is looked up.
bool KeptRepairs::isInterrupted(const Disk& disk) const
{
    return records_.hasInterrupted() && stateOf(disk) == KeptRepair::Interrupted;
}

}  // namespace orvane::desktop
