// SPDX-License-Identifier: Apache-2.0
#include "pellar/RepairDisk.h"

#include "fixwell/host/foundation/UTF8.h"
#include "pellar/tools/Capability.h"
#include "pellar/tools/ToolTable.h"

#include <sys/stat.h>

#include <algorithm>
#include <utility>
#include <variant>

namespace pellar {
namespace {

using fixwell::DiskReferencePointer;
using fixwell::ErrorCode;

bool isVolume(const DiskReferencePointer& disk)
{
    return disk && !disk->path.empty() && !disk->isWhole;
}

bool answer(bool value, ErrorCode* error)
{
    if (error != nullptr)
        *error = fixwell::kPLNoError;
    return value;
}

}  // namespace

RepairDisk::RepairDisk(fixwell::RunLoop& loop, const Texts& texts, const ManagerOptions& options,
                       fixwell::PLAsyncDelegate& delegate)
    : loop_(loop), texts_(texts), options_(options), delegate_(delegate)
{
}

ErrorCode RepairDisk::beginStoragesystemFilesystemVerifyForDisk(const DiskReferencePointer& disk)
{
    return begin(disk, Operation::Verify);
}

ErrorCode RepairDisk::beginStoragesystemFilesystemRepairForDisk(const DiskReferencePointer& disk)
{
    return begin(disk, Operation::Repair);
}

ErrorCode RepairDisk::beginPermissionsVerifyForDisk(const DiskReferencePointer&)
{
    return fixwell::kPLErrorUnsupported;
}

ErrorCode RepairDisk::beginPermissionsRepairForDisk(const DiskReferencePointer&)
{
    return fixwell::kPLErrorUnsupported;
}

ErrorCode RepairDisk::beginPartitionMapVerifyForDisk(const DiskReferencePointer&)
{
    return fixwell::kPLErrorUnsupported;
}

ErrorCode RepairDisk::beginPartitionMapRepairForDisk(const DiskReferencePointer&)
{
    return fixwell::kPLErrorUnsupported;
}

bool RepairDisk::canRepairPartitionMapForDisk(const DiskReferencePointer&, ErrorCode* error)
{
    return answer(false, error);
}

bool RepairDisk::canRepairStoragesystemFilesystemForDisk(const DiskReferencePointer& disk,
                                                         ErrorCode* error)
{
    return answer(isVolume(disk), error);
}

bool RepairDisk::canVerifyStoragesystemFilesystemForDisk(const DiskReferencePointer& disk,
                                                         ErrorCode* error)
{
    return answer(isVolume(disk), error);
}

void RepairDisk::cancelCurrentOperation()
{
    if (job_)
        job_->stop();
}

ErrorCode RepairDisk::begin(const DiskReferencePointer& disk, Operation operation)
{
    if (const ErrorCode error = refusal(disk, operation))
        return error;
    const Access access = operation == Operation::Verify ? Access::ReadOnly : Access::ReadWrite;
    auto claim = DiskClaim::take(*disk, access, options_.systemPaths);
    if (const auto* const error = std::get_if<ErrorCode>(&claim))
        return beginMounted(disk, operation, *error);
    start({disk, operation, std::get<DiskClaim>(std::move(claim)), {}, toolFor(disk->filesystem)});
    return fixwell::kPLNoError;
}

// Unmounting may take long, so it is the job's. What the system itself runs from is not tried.
ErrorCode RepairDisk::beginMounted(const DiskReferencePointer& disk, Operation operation,
                                   ErrorCode error)
{
    struct stat status = {};
    const bool isDevice = ::stat(disk->path.c_str(), &status) == 0 && S_ISBLK(status.st_mode);
    const bool mayBeMounted =
        error == fixwell::kPLErrorCouldNotUnmount || error == fixwell::kPLErrorDiskInUse;
    if (!isDevice || !mayBeMounted)
        return error;
    auto mounts = mountPlacesOf(status.st_rdev, options_.systemPaths);
    const bool isRoot = std::any_of(mounts.begin(), mounts.end(),
                                    [](const MountPlace& place) { return place.target == "/"; });
    if (mounts.empty() || isRoot)
        return error;
    start({disk, operation, std::nullopt, std::move(mounts), toolFor(disk->filesystem)});
    return fixwell::kPLNoError;
}

/// What can be said without touching the disk.
ErrorCode RepairDisk::refusal(const DiskReferencePointer& disk, Operation operation) const
{
    if (job_)
        return fixwell::kPLErrorBusy;
    if (!disk || disk->path.empty())
        return fixwell::kPLErrorNoDiskReference;
    if (disk->isWhole)
        return fixwell::kPLErrorUnsupported;
    if (disk->filesystem.empty())
        return fixwell::kPLNoError;
    const Capability capability = capabilityFor(disk->filesystem, operation, options_.toolPath);
    if (options_.commandTrace)
        options_.commandTrace(
            fixwell::printable(disk->filesystem) + ": " +
            (capability.isGiven() ? capability.program.string() : capability.reason.in(texts_)));
    return fixwell::kPLNoError;  // the job itself says why there is no way
}

void RepairDisk::start(JobRequest request)
{
    EventReceiver receiver{&delegate_, request.disk, options_.commandTrace, [this] {
                               job_.reset();
                           }};
    job_ = std::make_unique<Job>(std::move(request), std::move(receiver), loop_, options_, texts_);
}

}  // namespace pellar
