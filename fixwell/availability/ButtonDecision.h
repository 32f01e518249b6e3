// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/Contract.h"

#include <cstdint>
#include <memory>
#include <string_view>
#include <vector>

namespace fixwell {

/// Why an action is not available for the selection.
enum FXWReason : std::int32_t {
    FXWReasonNone = 0,
    FXWReasonIgnoresOwnership = 1,
    FXWReasonNotStartupDisk = 2,
    FXWReasonStartupDiskSelected = 3,
    FXWReasonHomeDirectory = 4,
    FXWReasonLiveCheckUnavailable = 5,
    FXWReasonCannotRepair = 6,
    FXWReasonCannotVerify = 7,
    FXWReasonNotMounted = 8,
    FXWReasonNotWritable = 9,
};

/// The English sentence, which is also the key in the string table; empty for no reason and for
/// an unknown one. `isMultiple`: the selection holds more than one disk.
std::string_view reasonText(std::int32_t reason, bool isMultiple);

/// What the rules ask about one selected disk. Each question is put only when the ones before
/// it made it matter, since some go to the disk-management library.
class DiskQuestions {
public:
    virtual ~DiskQuestions() = default;

    virtual std::int32_t diskType() const = 0;
    virtual bool canVerifyPartitionMap() const = 0;
    virtual bool canRepairPartitionMap() const = 0;
    virtual bool permissionsEnabled() const = 0;
    virtual bool canRepairPermissions() const = 0;
    virtual bool isMounted() const = 0;
    virtual bool isWritableVolume() const = 0;
    virtual bool isBootVolume() const = 0;
    virtual bool containUserHomeDirectory() const = 0;
    virtual bool isOfflineDiskImage() const = 0;
    virtual bool hasDiskImagePath() const = 0;
    // The file system's answers; NO where there is none.
    virtual bool filesystemCanBeRepaired() const = 0;
    virtual bool filesystemCanBeVerified() const = 0;
    virtual bool supportsLiveVerify() const = 0;
    // The repair tool's.
    virtual bool toolCanRepair() const = 0;
    virtual bool toolCanVerify() const = 0;
};

struct ActionAvailability {
    bool isEnabled = false;
    FXWReason reason = FXWReasonNone;

    friend bool operator==(const ActionAvailability&, const ActionAvailability&) = default;
};

struct ButtonDecision {
    ActionAvailability verifyDisk;
    ActionAvailability repairDisk;
    ActionAvailability verifyPermissions;
    ActionAvailability repairPermissions;
    bool clearHistory = false;
    bool showDetails = false;  ///< and the log itself

    friend bool operator==(const ButtonDecision&, const ButtonDecision&) = default;
};

/// A warning is open or the window is in the background.
ButtonDecision decideNothing();

/// A job runs: its own button stays, to stop it. Only for the action codes 1 to 6.
ButtonDecision decideRunning(std::int64_t action);

/// Nothing is selected, or the interface is locked.
ButtonDecision decideWithoutSelection();

/// Idle with a selection, at least one disk, in its order. The rules of all disks write into the
/// same flags, so the order matters: a whole disk can turn back on what a volume before it
/// turned off.
ButtonDecision decideForSelection(const std::vector<std::unique_ptr<DiskQuestions>>& selection,
                                  bool hasHistory);

}  // namespace fixwell
