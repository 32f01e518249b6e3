// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/jobs/Job.h"
#include "pellar/outcome/Outcome.h"
#include "pellar/undo/UndoStore.h"

#include <optional>
#include <vector>

namespace pellar {

/// Which disk this is, for a record of what a repair overwrites there.
[[nodiscard]] RecordedDisk recordedDisk(const contract::DiskReference& reference, int descriptor,
                                        ByteRange region);

/// How many places the repair would change, and how many bytes that are.
[[nodiscard]] Sentence changesOf(const std::vector<ByteRange>& ranges);

/// How a job takes part in work on a record: it stops it, and tells how far it has come.
[[nodiscard]] UndoWork workOf(JobContext& context);

/// Brings to a disk what a repair has come to elsewhere, with a record of what that overwrites, by
/// which it is finished when it is interrupted, and taken back later. The job's thread; the
/// references outlive it.
class RecordedWriting {
public:
    /// `notWritten` is the code for a disk that is as it was, and so still damaged.
    RecordedWriting(JobContext& context, RecordedRepair repair, contract::ErrorCode notWritten)
        : context_(context), repair_(std::move(repair)), notWritten_(notWritten)
    {
    }

    /// None when all of it is on the medium; else why not. `after` reads the disk as it is to be.
    [[nodiscard]] std::optional<Outcome> write(const std::vector<ByteRange>& ranges, Region& disk,
                                               RegionReader& after);

private:
    [[nodiscard]] std::optional<Outcome> apply(UndoRecord record, Region& disk) const;
    [[nodiscard]] Outcome notWritten(const Sentence& reason) const;
    void keepWithinLimits(const UndoStore& store, const std::string& id);

    JobContext& context_;
    const RecordedRepair repair_;
    const contract::ErrorCode notWritten_;
};

}  // namespace pellar
