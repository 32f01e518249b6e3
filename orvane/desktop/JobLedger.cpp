// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/JobLedger.h"

#include "fixwell/host/pellar/MessageKeys.h"

#include <utility>

namespace orvane::desktop {

std::string JobLedger::keyOf(const fixwell::DiskReferencePointer& reference)
{
    const auto disk =
        std::dynamic_pointer_cast<Disk>(host_.sharedDiskController().diskWithKRDisk(reference));
    return disk ? host_.histories().keyOf(disk->facts()) : std::string();
}

void JobLedger::jobWillBegin(const fixwell::DiskReferencePointer& disk, Operation operation)
{
    const std::string key = keyOf(disk);
    run_ = key.empty() ? 0
                       : host_.historyStore().beginRun(key, nameOf(operation),
                                                       std::chrono::system_clock::now());
    isJobRunning_ = true;
    events_.began();
}

void JobLedger::jobDidNotBegin(const fixwell::DiskReferencePointer& /*disk*/,
                               fixwell::ErrorCode error)
{
    end({std::string(fixwell::kPLVerdictFailed.text()), error,
         host_.OVLocalizedErrorString(error)});
}

void JobLedger::jobWillFinish(const fixwell::DiskReferencePointer& /*disk*/,
                              fixwell::ErrorCode error, const fixwell::Dictionary& result)
{
    RunEnd ended{std::string(result.string(fixwell::kPLVerdict)), error,
                 std::string(result.string(fixwell::kPLMessage))};
    if (ended.verdict.empty())
        ended.verdict = (error == 0 ? fixwell::kPLVerdictSound : fixwell::kPLVerdictFailed).text();
    end(ended);
}

void JobLedger::end(const RunEnd& end)
{
    isJobRunning_ = false;
    if (const std::int64_t run = std::exchange(run_, 0); run != 0)
        host_.historyStore().endRun(run, end, std::chrono::system_clock::now());
    events_.ended();
}

}  // namespace orvane::desktop
