// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/OutcomeReport.h"

#include "contract/pellar/ErrorCodes.h"

namespace pellar {

void tellOutcome(const Outcome& outcome, Operation operation, const Texts& texts, JobLog& log)
{
    const std::string message = messageOf(outcome, operation, log.diskName(), texts);
    const bool isUnanswered =
        outcome.verdict == Verdict::Failed || outcome.verdict == Verdict::Inconclusive;
    if (isUnanswered)
        log.failure(message);
    else if (!outcome.reason.isEmpty() && outcome.warnings.empty())
        log.remark(message);
    const bool isForGood =
        outcome.code == contract::kPLErrorDamagedForGood || outcome.code == contract::kPLErrorCutShort;
    log.verdict(outcome.verdict,
                operation == Operation::Verify ? Access::ReadOnly : Access::ReadWrite, isForGood);
    // What a repair cost is the last word, not the success.
    for (const Sentence& warning : outcome.warnings)
        log.failure(messageOf({outcome.verdict, outcome.code, 0, warning, {}}, operation,
                              log.diskName(), texts));
    log.trace("result: " + std::string(nameOf(outcome.verdict).text()) + ": " + message);
    log.finished(outcome.code, outcome.detail, nameOf(outcome.verdict), message);
}

}  // namespace pellar
