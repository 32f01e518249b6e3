// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Name.h"
#include "contract/pellar/ErrorCodes.h"
#include "orvane/privileges/HelperRequest.h"
#include "pellar/jobs/JobLog.h"

namespace orvane {

/// How a job ends that somebody else was to do and did not.
struct Undone {
    contract::ErrorCode error;
    contract::Name verdict;
    pellar::Sentence reason;
};

/// "cannot repair “NAME”: REASON", in the log and as the job's end, which has begun.
void tellUndone(const Undone& undone, const HelperRequest& request, const pellar::Texts& texts,
                pellar::JobLog& log);

}  // namespace orvane
