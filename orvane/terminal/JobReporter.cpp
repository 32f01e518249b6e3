// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/JobReporter.h"

namespace orvane {

void JobReporter::began(const StartedRun& run, const contract::DiskReferencePointer& disk)
{
    flush();
    current_ = names_.nameOf(run.identifier);
    reporter_.started(current_, actionName(run.subject, run.operation), window_.status());
    hooks_.follow(disk);
}

// The module's last rows are still to come, so the end is not said here.
void JobReporter::ended(const StartedRun& run, const RunEnd& end)
{
    unsaid_ = end;
    outcomes_[run.identifier] = end;
}

void JobReporter::flush()
{
    hooks_.flushRows();
    if (!unsaid_)
        return;
    const RunEnd outcome = *std::move(unsaid_);
    unsaid_.reset();
    reporter_.finished(current_, outcome.verdict, outcome.errorCode, outcome.message);
}

}  // namespace orvane
