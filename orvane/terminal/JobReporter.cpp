// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/JobReporter.h"

#include "fixwell/host/pellar/MessageKeys.h"

namespace orvane {

void JobReporter::jobWillBegin(const fixwell::DiskReferencePointer& disk, Operation operation)
{
    flush();
    current_ = names_.nameOf(disk->identifier);
    run_ = hooks_.runBegan(disk, operation);
    isInFlight_ = true;
    reporter_.started(current_, nameOf(operation), window_.status());
    hooks_.follow(disk);
}

// The module's row with the reason is still to come, so the end is not said here.
void JobReporter::jobDidNotBegin(const fixwell::DiskReferencePointer& disk,
                                 fixwell::ErrorCode error)
{
    settle(disk->identifier,
           {std::string(fixwell::kPLVerdictFailed.text()), error, hooks_.errorText(error)});
}

void JobReporter::jobWillFinish(const fixwell::DiskReferencePointer& disk, fixwell::ErrorCode error,
                                const fixwell::Dictionary& result)
{
    Outcome outcome{std::string(result.string(fixwell::kPLVerdict)), error,
                    std::string(result.string(fixwell::kPLMessage))};
    if (outcome.verdict.empty())
        outcome.verdict =
            (error == 0 ? fixwell::kPLVerdictSound : fixwell::kPLVerdictFailed).text();
    settle(disk->identifier, std::move(outcome));
}

void JobReporter::settle(const std::string& identifier, Outcome outcome)
{
    isInFlight_ = false;
    hooks_.runEnded(run_, outcome);
    unsaid_ = outcome;
    outcomes_[identifier] = std::move(outcome);
}

void JobReporter::flush()
{
    hooks_.flushRows();
    if (!unsaid_)
        return;
    const Outcome outcome = *std::move(unsaid_);
    unsaid_.reset();
    reporter_.finished(current_, outcome.verdict, outcome.error, outcome.message);
}

}  // namespace orvane
