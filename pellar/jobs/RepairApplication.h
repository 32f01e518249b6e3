// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/disks/WriteMark.h"
#include "pellar/jobs/Job.h"
#include "pellar/jobs/JobDisk.h"
#include "pellar/jobs/RecordedWriting.h"
#include "pellar/outcome/Outcome.h"
#include "pellar/overlay/TrialDisk.h"

#include <vector>

namespace pellar {

/// What a repair has come to where it was tried: kept, and brought to the disk; or only shown. The
/// job's thread; the references outlive it.
class RepairApplication {
public:
    /// `mark` is the disk's from before the trial.
    RepairApplication(JobContext& context, const JobDisk& disk, const TrialDisk& trial,
                      const WriteMark& mark);

    /// Writes what was changed to the disk. Answers `tried`, or why that is not what the disk has
    /// come to; then the disk is as it was, unless it is said otherwise.
    [[nodiscard]] Outcome apply(Outcome tried);
    /// Tells what would be changed, and answers what a verification with that knowledge would.
    [[nodiscard]] Outcome preview(const Outcome& tried);

private:
    void tellLoss(const Outcome& tried);
    [[nodiscard]] std::optional<Sentence> writeImage();
    JobContext& context_;
    JobLog& log_ = context_.log;
    const JobDisk& disk_;
    const TrialDisk& trial_;
    const WriteMark& mark_;
};

}  // namespace pellar
