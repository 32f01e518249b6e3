// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/pellar/PLRepairDisk.h"

#include <string_view>

namespace orvane {

/// What a job does to its disk.
enum class Operation {
    VerifyDisk,
    RepairDisk,
    VerifyPermissions,
    RepairPermissions,
    VerifyPartitionMap,
    RepairPartitionMap,
};

/// "verify", "repair-permissions", ...: stable names for files and other programs.
std::string_view nameOf(Operation operation);

/// Hears of every job of a module, besides the module itself. Main thread only.
class JobObserver {
public:
    virtual ~JobObserver() = default;

    /// Before the library is asked. The module has announced the job in the disk's history.
    virtual void jobWillBegin(const contract::DiskReferencePointer& disk, Operation operation) = 0;
    /// The library refused; the job is over.
    virtual void jobDidNotBegin(const contract::DiskReferencePointer& disk,
                                contract::ErrorCode error) = 0;
    /// The user has pressed Stop. There may be no job yet: images may still be attached for it.
    virtual void stopWasAsked() {}
    /// Before the module hears of it. `result` has the result keys.
    virtual void jobWillFinish(const contract::DiskReferencePointer& disk, contract::ErrorCode error,
                               const contract::Dictionary& result) = 0;
};

}  // namespace orvane
