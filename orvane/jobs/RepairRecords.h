// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/disks/DiskFacts.h"
#include "orvane/support/history/RunTable.h"
#include "pellar/jobs/JobOptions.h"
#include "pellar/undo/UndoStore.h"

#include <filesystem>
#include <vector>

namespace orvane {

/// What is kept of repairs: by this user, and by the administrator for all, of which everybody may
/// read the facts (Trials::systemDirectory). Read once, when this is made; any thread.
class RepairRecords {
public:
    /// Nothing where there is no store; none is made.
    explicit RepairRecords(const pellar::Trials& trials);

    /// The one that could be undone now, whoever asked for it; an older one cannot be before: of
    /// the disk's file system or, where it is a whole disk, of its partition map. Null where there
    /// is none, or where it may be another disk's of this name. Valid as long as this object.
    [[nodiscard]] const pellar::ListedRecord* newestOf(const DiskFacts& disk) const;
    /// The same of the permissions of the system that is installed on the disk.
    [[nodiscard]] const pellar::ListedRecord* newestOfPermissions(const DiskFacts& disk) const;
    /// Whether this user, who asked for it or is root, may undo it.
    [[nodiscard]] bool isUsers(const pellar::ListedRecord& record) const;
    /// Whether nothing is kept where this user cannot see it.
    [[nodiscard]] bool knowsAll() const { return knowsAll_; }
    /// Of any disk.
    [[nodiscard]] bool hasInterrupted() const;

private:
    void addSystemRecords(const std::filesystem::path& directory,
                          std::vector<pellar::ListedRecord>& all);
    void readPermissionRecords(const pellar::Trials& trials);

    pellar::RecordList ofVolumes_;
    pellar::RecordList ofMaps_;
    pellar::RecordList ofPermissions_;
    uid_t user_;
    bool knowsAll_ = true;
};

/// The run in which the repair was written to the disk; null where none of them is.
[[nodiscard]] const Run* runOf(const pellar::RecordedRepair& repair, const std::vector<Run>& runs);

}  // namespace orvane
