// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Dictionary.h"
#include "contract/support/OVDiskController.h"
#include "fixwell/Contract.h"

#include <cstdint>

namespace fixwell {

/// What an action-list entry asks for, and what the running job does (0 when idle).
enum FXWAction : std::int64_t {
    FXWActionNone = 0,
    FXWActionVerifyPermissions = 1,
    FXWActionRepairPermissions = 2,
    FXWActionVerifyPartitionMap = 3,
    FXWActionRepairPartitionMap = 4,
    FXWActionVerifyDisk = 5,
    FXWActionRepairDisk = 6,
};

/// What a launcher notes in its entry. The order is another one than the action codes'; the
/// finish callback and the warnings read this number, all others the action code.
enum FXWOperationType : std::int64_t {
    FXWOperationVerifyDisk = 1,
    FXWOperationRepairDisk = 2,
    FXWOperationVerifyPermissions = 3,
    FXWOperationRepairPermissions = 4,
    FXWOperationVerifyPartitionMap = 5,
    FXWOperationRepairPartitionMap = 6,
};

/// A verification or repair of a volume's file system, whose output is classified.
constexpr bool isDiskAction(std::int64_t action)
{
    return action == FXWActionVerifyDisk || action == FXWActionRepairDisk;
}

// The keys of an action-list entry: one disk and what is to be done with it. The entry travels
// from the queue to the in-flight item to the completed list, and gains keys on its way.

// Set when the entry is made.
inline const Name kEntryDiskIdentifier{"diskIdentifier"};
inline const Name kEntryVolumeName{"volumeName"};
inline const Name kEntryAction{"action"};
inline const Name kEntryDisk{"disk"};

// Set by the launchers.
inline const Name kFXW_OperationType{"kFXW_OperationType"};
inline const Name kEntryDiskWasMounted{"diskWasMounted"};
inline const Name kEntryIsQVFS{"isQVFS"};

// Set when the user stops the job.
inline const Name kEntryStoppedByUser{"stoppedByUser"};

// Set by the progress callback.
inline const Name kFXW_OSVersionKey{"kFXW_OSVersionKey"};
inline const Name kFXW_DISK_IS_KESTRON{"kFXW_DISK_IS_KESTRON"};
inline const Name kFXW_DISK_IS_MORLA{"kFXW_DISK_IS_MORLA"};
inline const Name kFXW_FirstKestronUpdate{"kFXW_FirstKestronUpdate"};

// Set by the finish callback when the operation failed: what the alert at the job's end says.
inline const Name kEntryPostWarning{"postWarning"};
inline const Name kEntryPostWarningTitle{"postWarningtitle"};

inline Dictionary makeActionListEntry(const OVDiskPointer& disk, FXWAction action)
{
    return Dictionary::of({{kEntryDiskIdentifier, disk->diskIdentifier()},
                           {kEntryVolumeName, disk->displayName()},
                           {kEntryAction, static_cast<std::int64_t>(action)},
                           {kEntryDisk, disk}});
}

/// The entry's own disk, or none.
inline OVDiskPointer diskOfEntry(const Dictionary& entry)
{
    return entry[kEntryDisk].object<OVDisk>();
}
}  // namespace fixwell
