// SPDX-License-Identifier: Apache-2.0
#include "fixwell/operations/InUseErrors.h"

#include "fixwell/operations/LaunchTable.h"

namespace fixwell {

ErrorCode restatedLaunchError(ErrorCode code, FXWOperationType type, const OVDisk& disk)
{
    if (code != kPLErrorDiskInUse || isPartitionMapOperation(type))
        return code;
    if (type == FXWOperationRepairDisk)
        return kOVErrorCannotRepairInUse;
    const bool asksForHome = type == FXWOperationVerifyDisk;
    if (disk.isBootVolume() || (asksForHome && disk.containUserHomeDirectory()))
        return kOVErrorSystemDiskInUse;
    return kOVErrorDiskInUse;
}

ErrorCode restatedFinishError(ErrorCode code, FXWOperationType type, const OVDisk* disk)
{
    if (code != kPLErrorDiskInUse)
        return code;
    if (type == FXWOperationRepairDisk)
        return kOVErrorCannotRepairInUse;
    if (disk != nullptr && (disk->isBootVolume() || disk->containUserHomeDirectory()))
        return kOVErrorSystemDiskInUse;
    return kOVErrorDiskInUse;
}

}  // namespace fixwell
