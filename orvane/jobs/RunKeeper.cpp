// SPDX-License-Identifier: Apache-2.0
#include "orvane/jobs/RunKeeper.h"

#include "fixwell/host/pellar/MessageKeys.h"

#include <utility>

namespace orvane {

void RunKeeper::begin(const fixwell::DiskReferencePointer& reference, Operation operation)
{
    // What was said until now has its time before this run's.
    host_.histories().saveNew();
    const auto disk =
        std::dynamic_pointer_cast<Disk>(host_.sharedDiskController().diskWithKRDisk(reference));
    run_ = disk ? host_.historyStore().beginRun(host_.histories().keyOf(disk->facts()),
                                                nameOf(operation), std::chrono::system_clock::now())
                : 0;
}

RunEnd RunKeeper::refuse(fixwell::ErrorCode error)
{
    const RunEnd end{std::string(fixwell::kPLVerdictFailed.text()), error,
                     host_.OVLocalizedErrorString(error)};
    keep(end);
    return end;
}

RunEnd RunKeeper::finish(fixwell::ErrorCode error, const fixwell::Dictionary& result)
{
    RunEnd end{std::string(result.string(fixwell::kPLVerdict)), error,
               std::string(result.string(fixwell::kPLMessage))};
    if (end.verdict.empty())
        end.verdict = (error == 0 ? fixwell::kPLVerdictSound : fixwell::kPLVerdictFailed).text();
    keep(end);
    return end;
}

void RunKeeper::keep(const RunEnd& end)
{
    if (const std::int64_t run = std::exchange(run_, 0); run != 0)
        host_.historyStore().endRun(run, end, std::chrono::system_clock::now());
}

}  // namespace orvane
