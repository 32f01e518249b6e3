// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/pellar/PLRepairDisk.h"
#include "pellar/jobs/JobOptions.h"

namespace pellar {

/// Hears of every job of a manager, besides the manager's delegate. Main thread only.
class JobObserver {
public:
    /// Before anything is done.
    virtual void jobWillBegin(const contract::DiskReferencePointer& disk, Task task) = 0;
    /// The job was refused, and is over.
    virtual void jobDidNotBegin(const contract::DiskReferencePointer& disk,
                                contract::ErrorCode error) = 0;
    /// A stop was asked for. There may be no job yet.
    virtual void stopWasAsked() {}
    /// How far the job is, in per cent, strictly between 0 and 100.
    virtual void jobDidProgress(const contract::DiskReferencePointer& /*disk*/, double /*percent*/)
    {
    }
    /// Before the delegate hears of it. `result` has the result keys.
    virtual void jobWillFinish(const contract::DiskReferencePointer& disk,
                               contract::ErrorCode error, const contract::Dictionary& result) = 0;

protected:
    ~JobObserver() = default;
};

}  // namespace pellar
