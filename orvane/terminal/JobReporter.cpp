// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/JobReporter.h"

namespace orvane {

void JobReporter::jobWillBegin(const contract::DiskReferencePointer& disk, Operation operation)
{
    flush();
    current_ = names_.nameOf(disk->identifier);
    runs_.begin(disk, operation);
    isInFlight_ = true;
    reporter_.started(current_, nameOf(operation), window_.status());
    hooks_.follow(disk);
}

// The module's row with the reason is still to come, so the end is not said here.
void JobReporter::jobDidNotBegin(const contract::DiskReferencePointer& disk,
                                 contract::ErrorCode error)
{
    settle(disk->identifier, runs_.refuse(error));
}

void JobReporter::jobWillFinish(const contract::DiskReferencePointer& disk, contract::ErrorCode error,
                                const contract::Dictionary& result)
{
    settle(disk->identifier, runs_.finish(error, result));
}

void JobReporter::settle(const std::string& identifier, RunEnd outcome)
{
    isInFlight_ = false;
    unsaid_ = outcome;
    outcomes_[identifier] = std::move(outcome);
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
