// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/pellar/ErrorCodes.h"
#include "contract/pellar/PLRepairDisk.h"
#include "contract/support/OVDisk.h"
#include "fixwell/Contract.h"
#include "fixwell/jobs/ActionListEntry.h"

#include <string_view>

namespace fixwell {

/// How an operation is announced, started and reported. The six differ in these alone.
struct Launch {
    FXWOperationType operationType;
    std::string_view title;         ///< takes the disk's name
    std::string_view startLogLine;  ///< for the activity log; empty for none
    std::string_view failureProgressText;
    std::string_view failureText;  ///< takes the error's text; empty for none
    ErrorCode (PLRepairDisk::*begin)(const DiskReferencePointer&);
};

extern const Launch launchVerifyDisk;
extern const Launch launchRepairDisk;
extern const Launch launchVerifyPermissions;
extern const Launch launchRepairPermissions;
extern const Launch launchVerifyPartitionMap;
extern const Launch launchRepairPartitionMap;

constexpr bool isPermissionOperation(FXWOperationType type)
{
    return type == FXWOperationVerifyPermissions || type == FXWOperationRepairPermissions;
}

constexpr bool isPartitionMapOperation(FXWOperationType type)
{
    return type == FXWOperationVerifyPartitionMap || type == FXWOperationRepairPartitionMap;
}

/// When the library refused to start: "in use" restated by the operation and the kind of disk,
/// any other code as it is. Only a disk verification asks for the home directory.
ErrorCode restatedLaunchError(ErrorCode code, FXWOperationType type, const OVDisk& disk);

/// When a job failed: the same, but every operation asks for the home directory. `disk` may be
/// none.
ErrorCode restatedFinishError(ErrorCode code, FXWOperationType type, const OVDisk* disk);

}  // namespace fixwell
