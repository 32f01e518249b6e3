// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/disks/WriteMark.h"
#include "pellar/jobs/Job.h"
#include "pellar/jobs/JobDisk.h"
#include "pellar/jobs/RecordedWriting.h"
#include "pellar/outcome/Outcome.h"
#include "pellar/overlay/TrialDisk.h"

namespace pellar {

/// Brings to the disk what a repair has come to where it was tried (RecordedWriting). `mark` is the
/// disk's from before the trial. Answers `tried`, or why that is not what the disk has come to;
/// then the disk is as it was, unless it is said otherwise. The job's thread.
[[nodiscard]] Outcome applyTrial(const TrialDisk& trial, const WriteMark& mark, const JobDisk& disk,
                                 JobContext& context, Outcome tried);

}  // namespace pellar
