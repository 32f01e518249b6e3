// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/jobs/JobLog.h"
#include "pellar/outcome/Outcome.h"

namespace pellar {

/// Ends the log of a job on a volume: the reason where there is one, the verdict, and *finished*.
void tellOutcome(const Outcome& outcome, Operation operation, const Texts& texts, JobLog& log);

}  // namespace pellar
