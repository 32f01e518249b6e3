// SPDX-License-Identifier: Apache-2.0
#pragma once

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
/// finish callback and the warnings read this number, everybody else the action code.
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

}  // namespace fixwell
