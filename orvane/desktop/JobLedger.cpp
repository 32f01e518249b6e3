// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/JobLedger.h"

namespace orvane::desktop {

void JobLedger::jobWillBegin(const fixwell::DiskReferencePointer& disk, Operation operation)
{
    runs_.begin(disk, operation);
    isJobRunning_ = true;
    events_.began();
}

void JobLedger::jobDidNotBegin(const fixwell::DiskReferencePointer& /*disk*/,
                               fixwell::ErrorCode error)
{
    runs_.refuse(error);
    end();
}

void JobLedger::jobWillFinish(const fixwell::DiskReferencePointer& /*disk*/,
                              fixwell::ErrorCode error, const fixwell::Dictionary& result)
{
    runs_.finish(error, result);
    end();
}

void JobLedger::end()
{
    isJobRunning_ = false;
    events_.ended();
}

}  // namespace orvane::desktop
