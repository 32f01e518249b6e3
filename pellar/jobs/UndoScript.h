// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/jobs/Job.h"
#include "pellar/jobs/JobDisk.h"
#include "pellar/undo/UndoStore.h"

#include <optional>

namespace pellar {

/// What `UndoScript` is to do, and to which disk.
struct UndoRequest {
    Task task;  ///< of a file system or a partition map
    contract::DiskReferencePointer disk;
    std::vector<Mount> mounts;  ///< where it is mounted, which it is not while it is written to
};

/// Takes back the newest repair of a disk (Operation::Undo), or completes one that was interrupted
/// (Operation::Finish), by the record that was kept of it. The references outlive it.
class UndoScript final : public Script {
public:
    UndoScript(UndoRequest request, JobContext context);

    void run() override;

private:
    /// A failure, or none.
    using Failure = std::optional<Outcome>;

    Failure carryOut();
    Failure carryOutOn(Region& region, const RecordedDisk& disk);
    Failure onVolume();
    Failure onMap();
    Failure work(UndoRecord& record, Region& region);
    Failure objectionTo(const ListedRecord* record) const;
    void report(const Failure& failure);
    bool isUndo() const { return request_.task.operation == Operation::Undo; }

    const UndoRequest request_;
    JobContext context_;
    JobLog& log_ = context_.log;
};

}  // namespace pellar
