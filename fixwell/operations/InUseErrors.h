// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/pellar/ErrorCodes.h"
#include "contract/support/OVDisk.h"
#include "fixwell/Contract.h"
#include "fixwell/jobs/ActionCodes.h"

namespace fixwell {

/// When the library refused to start: "in use" restated by the operation and the kind of disk,
/// any other code as it is. Only a disk verification asks for the home directory.
ErrorCode restatedLaunchError(ErrorCode code, FXWOperationType type, const OVDisk& disk);

/// When a job failed: the same, but every operation asks for the home directory. `disk` may be
/// none.
ErrorCode restatedFinishError(ErrorCode code, FXWOperationType type, const OVDisk* disk);

}  // namespace fixwell
