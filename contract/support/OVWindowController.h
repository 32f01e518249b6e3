// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Dictionary.h"
#include "contract/foundation/RunLoop.h"
#include "contract/support/OVDisk.h"

#include <string>
#include <string_view>
#include <vector>

namespace contract {

// The keys of a completion report, which tells the host how a job ended, and their values.

inline const Name kOVOP_ResultKey{"kOVOP_ResultKey"};
inline const Name kOVOP_SuccessKey{"kOVOP_SuccessKey"};
inline const Name kOVOP_FailKey{"kOVOP_FailKey"};
inline const Name kOVOP_DiskIdentifierKey{"kOVOP_DiskIdentifierKey"};
inline const Name kOVOP_DiskKey{"kOVOP_DiskKey"};
inline const Name kOVOP_ActionTypeKey{"kOVOP_ActionTypeKey"};
inline const Name kOVOP_RepairDiskKey{"kOVOP_RepairDiskKey"};
inline const Name kOVOP_RepairDiskPermissionsKey{"kOVOP_RepairDiskPermissionsKey"};
inline const Name kOVOP_VerifyDiskPermissionsKey{"kOVOP_VerifyDiskPermissionsKey"};
inline const Name kOVOP_VerifyDiskKey{"kOVOP_VerifyDiskKey"};

/// The host window: its selection, its progress bar and status line, its lock. Main thread only.
class OVWindowController {
public:
    virtual ~OVWindowController() = default;

    /// What is selected in the disk list, in the list's order. `flag` is always NO.
    virtual std::vector<OVDiskPointer> allSelectedItemsFilterDuplicates(bool flag,
                                                                        bool filtersDuplicates) = 0;

    /// Locks what must not be changed while a job runs.
    virtual void setInterfaceLock() = 0;
    virtual void resetInterfaceLock() = 0;
    virtual bool interfaceLock() const = 0;

    virtual void activateGlobalProgressBar(bool isActive) = 0;
    virtual void activateGlobalProgressText(bool isActive) = 0;
    virtual void setGlobalProgressBarIndeterminate(bool isIndeterminate) = 0;
    /// `sender` is only an identity.
    virtual void startGlobalProgressBarAnimation(const void* sender) = 0;
    virtual void setGlobalProgressBarValue(double percent) = 0;
    virtual void setGlobalProgressText(std::string_view text) = 0;

    /// A job has ended; `report` has the completion report's keys.
    virtual void notifyWindowOfCompletion(const Dictionary& report) = 0;
};

/// Estimates how long a job still takes. A new estimator starts at the moment it is made.
class OVTimeEstimator {
public:
    virtual ~OVTimeEstimator() = default;

    /// Moves the reference point: at `start` the job stood at `percent` (0 to 100).
    virtual void setStartTimeWithPercentComplete(Threads::Date start, double percent) = 0;
    /// A short localized duration ("2 minutes"), or empty while there is no telling yet.
    virtual std::string timeEstimateString(double percent) = 0;
};

}  // namespace contract
