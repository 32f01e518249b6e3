// SPDX-License-Identifier: Apache-2.0
#include "orvane/jobs/RunKeeper.h"

#include "contract/pellar/ErrorCodes.h"
#include "contract/pellar/MessageKeys.h"
#include "pellar/disks/LoopDevice.h"

#include <sys/stat.h>

#include <utility>

namespace orvane {

void RunKeeper::begin(const contract::DiskReferencePointer& reference, Operation operation)
{
    // What was said until now has its time before this run's.
    host_.histories().saveNew();
    const bool isOfImage =
        reference && reference->storage == contract::DiskReference::Storage::FileRegion;
    image_ = isOfImage ? reference->path : std::filesystem::path();
    const auto disk =
        std::dynamic_pointer_cast<Disk>(host_.sharedDiskController().diskWithKRDisk(reference));
    run_ = disk ? host_.historyStore().beginRun(host_.histories().keyOf(disk->facts()),
                                                nameOf(operation), std::chrono::system_clock::now())
                : 0;
}

RunEnd RunKeeper::refuse(contract::ErrorCode error)
{
    const RunEnd end{std::string(contract::kPLVerdictFailed.text()), error,
                     host_.OVLocalizedErrorString(error)};
    keep(end);
    return end;
}

RunEnd RunKeeper::finish(contract::ErrorCode error, const contract::Dictionary& result)
{
    RunEnd end{std::string(result.string(contract::kPLVerdict)), error,
               std::string(result.string(contract::kPLMessage))};
    if (end.verdict.empty())
        end.verdict = (error == 0 ? contract::kPLVerdictSound : contract::kPLVerdictFailed).text();
    keep(end);
    return end;
}

std::string RunKeeper::withDevice(contract::ErrorCode error, std::string text) const
{
    const bool isInUse = error == contract::kPLErrorDiskInUse ||
                         error == contract::kOVErrorDiskInUse ||
                         error == contract::kOVErrorCannotRepairInUse;
    struct stat status = {};
    if (!isInUse || image_.empty() || ::stat(image_.c_str(), &status) != 0)
        return text;
    const std::string device =
        pellar::loopDeviceOn(status.st_dev, status.st_ino, pellar::SystemPaths());
    return device.empty()
               ? text
               : text + " " + host_.translator().sentence("The image is attached as %@.", {device});
}

void RunKeeper::keep(const RunEnd& end)
{
    if (const std::int64_t run = std::exchange(run_, 0); run != 0)
        host_.historyStore().endRun(run, end, std::chrono::system_clock::now());
}

}  // namespace orvane
