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
bool needsRights(pellar::Subject subject, const Disk& disk)
{
    return ::geteuid() != 0 &&
           disk.facts().storage == contract::DiskReference::Storage::BlockDevice &&
           (subject == pellar::Subject::Permissions || disk.isMounted() ||
            ::access(disk.facts().path.c_str(), R_OK | W_OK) != 0);
}

std::string_view whyNotKept(pellar::Operation operation, const UndoSituation& situation)
{
    switch (situation.kept) {
        case KeptRepair::None:
            return situation.isOfPermissions ? "No repair of permissions on this disk is kept."
                                             : "No repair of this disk is kept.";
        case KeptRepair::Others: return "Another user asked for the last repair of this disk.";
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
    return situation.isThere ? whyNotKept(operation, situation) : "Not available for this disk.";
}

const pellar::ListedRecord* KeptRepairs::newestOf(pellar::Subject subject, const Disk& disk) const
{
    const Disk* const treated = subjectIn(disk);
    if (treated == nullptr)
        return nullptr;
    return subject == pellar::Subject::Permissions ? records_.newestOfPermissions(treated->facts())
                                                   : records_.newestOf(treated->facts());
}

KeptRepair KeptRepairs::stateOf(pellar::Subject subject, const Disk& disk) const
{
    const pellar::ListedRecord* const record = newestOf(subject, disk);
    if (record == nullptr)
        return needsRights(subject, disk) && !records_.knowsAll() ? KeptRepair::Unknown
                                                                  : KeptRepair::None;
    if (record->isInUse)
        return KeptRepair::InUse;
    if (!records_.isUsers(*record))
        return KeptRepair::Others;
    return record->isInterrupted() ? KeptRepair::Interrupted : KeptRepair::Applied;
}

// Asked for every row of the list: where nothing is interrupted, no disk's name is looked up.
bool KeptRepairs::isInterrupted(const Disk& disk) const
{
    if (!records_.hasInterrupted())
        return false;
    const pellar::ListedRecord* const record = newestOf(pellar::Subject::Filesystem, disk);
    return record != nullptr && record->isInterrupted();
}

}  // namespace orvane::desktop
