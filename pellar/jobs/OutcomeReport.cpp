// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/OutcomeReport.h"

namespace pellar {

void tellOutcome(const Outcome& outcome, Operation operation, const Texts& texts, JobLog& log)
{
    const std::string message = messageOf(outcome, operation, log.diskName(), texts);
    const bool isUnanswered =
        outcome.verdict == Verdict::Failed || outcome.verdict == Verdict::Inconclusive;
    if (isUnanswered)
        log.failure(message);
    else if (!outcome.reason.isEmpty())
        log.remark(message);
    log.verdict(outcome.verdict,
                operation == Operation::Verify ? Access::ReadOnly : Access::ReadWrite);
    log.trace("result: " + std::string(nameOf(outcome.verdict).text()) + ": " + message);
    log.finished(outcome.code, outcome.detail, nameOf(outcome.verdict), message);
}

}  // namespace pellar
