// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Dictionary.h"
#include "contract/support/OVDisk.h"

#include <string>
#include <string_view>
#include <vector>

namespace contract {

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

}  // namespace contract
