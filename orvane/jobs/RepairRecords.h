// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/disks/DiskFacts.h"
#include "orvane/support/history/RunTable.h"
#include "pellar/jobs/JobOptions.h"
#include "pellar/undo/UndoStore.h"

#include <vector>

namespace orvane {

/// What is kept of repairs, as far as this user may see it, and undo it: what an administrator's
/// rights were needed for is kept where only root reads. Read once, when this is made; any thread.
class RepairRecords {
public:
    /// Nothing where there is no store; none is made.
    explicit RepairRecords(const pellar::Trials& trials);

    /// The one that could be undone now: of the disk's file system or, where it is a whole disk, of
    /// its partition map. Null where there is none, or where it may be another disk's of this name.
    /// Valid as long as this object.
    [[nodiscard]] const pellar::ListedRecord* newestOf(const DiskFacts& disk) const;
    /// Of any disk.
    [[nodiscard]] bool hasInterrupted() const;

private:
    pellar::RecordList ofVolumes_;
    pellar::RecordList ofMaps_;
    uid_t user_;
};

/// The run in which the repair was written to the disk; null where none of them is.
[[nodiscard]] const Run* runOf(const pellar::RecordedRepair& repair, const std::vector<Run>& runs);

}  // namespace orvane
