// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/jobs/RepairRecords.h"
#include "orvane/support/disks/Disk.h"
#include "pellar/jobs/JobOptions.h"

#include <cstddef>
#include <string_view>
#include <utility>

namespace orvane::desktop {

/// What is kept of a disk's last repair, as far as this user can see.
enum class KeptRepair {
    None,
    Applied,      ///< it can be undone
    Interrupted,  ///< it can be finished or undone
    InUse,        ///< a program works on it
    Others,       ///< another user asked for it
    Unknown,      ///< only an administrator can see it, if there is one
};

/// What is selected when a repair is to be undone or finished.
struct UndoSituation {
    std::size_t selectedDisks = 0;
    bool isLocked = false;  ///< a job runs
    bool isThere = true;    ///< the disk, or what is in the image, is there and has been read
    KeptRepair kept = KeptRepair::None;
    bool isOfPermissions = false;
};

/// Why `operation` (Undo or Finish) cannot be chosen, as a key of the host's texts; empty when it
/// can.
[[nodiscard]] std::string_view reasonAgainst(pellar::Operation operation,
                                             const UndoSituation& situation);

/// What is kept of repairs of the disks in the list. Main thread.
class KeptRepairs {
public:
    explicit KeptRepairs(pellar::Trials trials) : trials_(std::move(trials)) { read(); }

    /// Looks again: after a repair, and before something is decided by it.
    void read() { records_ = RepairRecords(trials_); }

    /// Of the disk or, where it is an image, of what is in it; null where there is none. Valid
    /// until the next `read`.
    [[nodiscard]] const pellar::ListedRecord* newestOf(pellar::Subject subject,
                                                       const Disk& disk) const;
    /// Of what it holds: its file system or partition map, or the permissions of the files.
    [[nodiscard]] KeptRepair stateOf(pellar::Subject subject, const Disk& disk) const;
    [[nodiscard]] bool isInterrupted(const Disk& disk) const;
    /// Whether there is a place to try repairs in.
    [[nodiscard]] bool canTry() const { return !trials_.room.directory.empty(); }

private:
    const pellar::Trials trials_;
    RepairRecords records_{{}};
};

}  // namespace orvane::desktop
