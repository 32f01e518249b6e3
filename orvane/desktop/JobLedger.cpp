// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/JobLedger.h"

namespace orvane::desktop {

void JobLedger::jobWillBegin(const contract::DiskReferencePointer& disk, Operation operation)
{
    runs_.begin(disk, operation);
    isJobRunning_ = true;
    run_ = {operation, disk ? disk->name : std::string(), disk ? disk->identifier : std::string()};
    events_.began(run_);
}

void JobLedger::jobDidNotBegin(const contract::DiskReferencePointer& /*disk*/,
                               contract::ErrorCode error)
{
    end(runs_.refuse(error));
}

void JobLedger::jobWillFinish(const contract::DiskReferencePointer& /*disk*/,
                              contract::ErrorCode error, const contract::Dictionary& result)
{
    end(runs_.finish(error, result));
}

void JobLedger::end(const RunEnd& end)
{
    isJobRunning_ = false;
    events_.ended(run_, end);
}

}  // namespace orvane::desktop
