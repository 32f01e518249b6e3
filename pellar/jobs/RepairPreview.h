// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/jobs/Job.h"
#include "pellar/outcome/Outcome.h"
#include "pellar/overlay/TrialDisk.h"
#include "pellar/tools/Tool.h"

#include <optional>

namespace pellar {

/// Tells what a repair has come to where it was tried, which is not brought to the disk. The job's
/// thread; the references outlive it.
class RepairPreview {
public:
    RepairPreview(JobContext& context, const Tool& tool, const TrialDisk& trial)
        : context_(context), tool_(tool), trial_(trial)
    {
    }

    /// Answers what a verification with that knowledge would: damaged, and whether the repair
    /// makes it sound.
    [[nodiscard]] Outcome tell(const Outcome& tried, const FileCounts& counts);

private:
    void tellChanges(const std::vector<ByteRange>& ranges, const Outcome& tried,
                     const FileCounts& counts);
    void tellCollected();
    [[nodiscard]] std::optional<Sentence> writeImage();

    JobContext& context_;
    JobLog& log_ = context_.log;
    const Tool& tool_;
    const TrialDisk& trial_;
};

}  // namespace pellar
