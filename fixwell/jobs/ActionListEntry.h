// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Dictionary.h"
#include "contract/support/OVDiskController.h"
#include "fixwell/Contract.h"
#include "fixwell/jobs/ActionCodes.h"

namespace fixwell {

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

Dictionary makeActionListEntry(const OVDiskPointer& disk, FXWAction action);

/// The entry's own disk, or none.
OVDiskPointer diskOfEntry(const Dictionary& entry);

}  // namespace fixwell
