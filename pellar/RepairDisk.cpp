// SPDX-License-Identifier: Apache-2.0
#include "pellar/RepairDisk.h"

#include "contract/foundation/UTF8.h"
#include "pellar/jobs/JobScript.h"
#include "pellar/jobs/LiveScript.h"
#include "pellar/jobs/MapScript.h"
#include "pellar/jobs/PartOfImageScript.h"
#include "pellar/jobs/PermissionsScript.h"
#include "pellar/packages/InstalledSystem.h"
#include "pellar/partitions/MapDisk.h"
#include "pellar/tools/Capability.h"
#include "pellar/tools/ToolTable.h"

#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <utility>
#include <variant>

namespace pellar {
namespace {

using contract::DiskReferencePointer;
using contract::ErrorCode;

bool isVolume(const DiskReferencePointer& disk)
{
    return disk && !disk->path.empty() && !disk->isWhole;
}

/// Whether a device may be neither opened as the operation must, nor unmounted, by this user; and
/// whether installed files are to be changed. Nobody is asked for a password merely to look at the
/// files of a volume that is mounted: what this user may not see of it is counted and said.
bool needsPrivileges(Subject subject, const contract::DiskReference& disk, Operation operation,
                     const SystemPaths& paths)
{
    struct stat status = {};
    if (::geteuid() == 0 || ::stat(disk.path.c_str(), &status) != 0 || !S_ISBLK(status.st_mode))
        return false;
    if (subject == Subject::Permissions)
        return operation == Operation::Repair;
    const int wanted = operation == Operation::Verify ? R_OK : R_OK | W_OK;
    return ::access(disk.path.c_str(), wanted) != 0 || !mountsOf(disk.path, paths).empty();
}

/// Whether the directory lies on what is mounted at one of the places.
bool holdsDirectory(const std::vector<Mount>& places, const std::filesystem::path& directory,
                    const SystemPaths& paths)
{
    const auto holder = mountHolding(currentMounts(paths), directory);
    return holder && std::any_of(places.begin(), places.end(), [&](const Mount& place) {
               return place.target == holder->target;
           });
}

bool answer(bool value, ErrorCode* error)
{
    if (error != nullptr)
        *error = contract::kPLNoError;
    return value;
}

}  // namespace

RepairDisk::RepairDisk(contract::RunLoop& loop, const Texts& texts, const ManagerOptions& options,
                       contract::PLAsyncDelegate& delegate)
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

ErrorCode RepairDisk::beginPermissionsVerifyForDisk(const DiskReferencePointer& disk)
{
    return beginPermissions(disk, Operation::Verify);
}

ErrorCode RepairDisk::beginPermissionsRepairForDisk(const DiskReferencePointer& disk)
{
    return beginPermissions(disk, Operation::Repair);
}

ErrorCode RepairDisk::beginPartitionMapVerifyForDisk(const DiskReferencePointer& disk)
{
    return beginPartitionMap(disk, Operation::Verify);
}

ErrorCode RepairDisk::beginPartitionMapRepairForDisk(const DiskReferencePointer& disk)
{
    return beginPartitionMap(disk, Operation::Repair);
}

bool RepairDisk::canRepairPartitionMapForDisk(const DiskReferencePointer& disk, ErrorCode* error)
{
    const bool isDisk = disk && !disk->path.empty() && disk->isWhole;
    // What this user may not read is looked at when the job has the right to.
    const bool isUnknown =
        isDisk && options_.privileged &&
        needsPrivileges(Subject::PartitionMap, *disk, Operation::Verify, options_.systemPaths);
    return answer(isUnknown || (isDisk && glanceAtMap(*disk).kind != PartitionMap::Kind::None),
                  error);
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
    if (beginPrivileged(Subject::Filesystem, disk, operation))
        return contract::kPLNoError;
    const Access access = operation == Operation::Verify ? Access::ReadOnly : Access::ReadWrite;
    auto claim = DiskClaim::attempt(*disk, access, options_.systemPaths);
    if (const auto* const error = std::get_if<ErrorCode>(&claim))
        return beginMounted(disk, operation, *error);
    JobRequest request{disk, operation, std::nullopt, {}, toolFor(disk->filesystem)};
    // Nobody waits on the main thread: a device that is locked is claimed by the job.
    if (auto* const taken = std::get_if<DiskClaim>(&claim))
        request.claim.emplace(std::move(*taken));
    startVolume(std::move(request));
    return contract::kPLNoError;
}

/// NO when the job needs nobody's help, or there is none.
bool RepairDisk::beginPrivileged(Subject subject, const DiskReferencePointer& disk,
                                 Operation operation)
{
    if (!options_.privileged || !needsPrivileges(subject, *disk, operation, options_.systemPaths))
        return false;
    const auto& isAllowed = options_.archiveFetching.isAllowed;
    const bool fetches = subject == Subject::Permissions && isAllowed && isAllowed();
    const PrivilegedJob job{subject, operation, *disk, nullptr, fetches};
    start(disk, [job, this](StopSwitch& stop, EventRoad& road) {
        return options_.privileged(job, stop, road);
    });
    return true;
}

// Unmounting may take long, so it is the job's. What the system itself runs from, and the user's
// home, is not tried where it can be verified as it is.
ErrorCode RepairDisk::beginMounted(const DiskReferencePointer& disk, Operation operation,
                                   ErrorCode error)
{
    if (error != contract::kPLErrorCouldNotUnmount && error != contract::kPLErrorDiskInUse)
        return error;
    auto mounts = mountsOf(disk->path, options_.systemPaths);
    const bool isRoot = std::any_of(mounts.begin(), mounts.end(),
                                    [](const Mount& place) { return place.target == "/"; });
    const bool staysMounted =
        isRoot || holdsDirectory(mounts, options_.homeDirectory, options_.systemPaths);
    if (operation == Operation::Verify && staysMounted && mounts.front().filesystem == "btrfs")
        startLive(disk, mounts);
    else if (mounts.empty() || isRoot)
        return error;
    else
        startVolume({disk, operation, std::nullopt, std::move(mounts), toolFor(disk->filesystem)});
    return contract::kPLNoError;
}

void RepairDisk::startLive(const DiskReferencePointer& disk, const std::vector<Mount>& mounts)
{
    start(disk, [disk, mounts, this](StopSwitch& stop, EventRoad& road) {
        return std::make_unique<LiveScript>(disk, mounts, options_, texts_, stop, road);
    });
}

// A script maker can be copied, a claim cannot.
void RepairDisk::startVolume(JobRequest request)
{
    const auto disk = request.disk;
    const auto shared = std::make_shared<JobRequest>(std::move(request));
    start(disk, [this, shared](StopSwitch& stop, EventRoad& road) -> std::unique_ptr<Script> {
        if (isPartThatOthersAttach(*shared))
            return std::make_unique<PartOfImageScript>(std::move(*shared), options_, texts_, stop,
                                                       road);
        return std::make_unique<JobScript>(std::move(*shared), options_, texts_, stop, road);
    });
}

/// The user may not attach it, but others may.
bool RepairDisk::isPartThatOthersAttach(const JobRequest& request) const
{
    return ::geteuid() != 0 && options_.privileged && request.claim &&
           !request.claim->isBlockDevice() && !request.claim->isAllOfIt();
}

// The disk is claimed by the job: why it cannot be had is then said in the log, where a refusal to
// begin says nothing.
ErrorCode RepairDisk::beginPartitionMap(const DiskReferencePointer& disk, Operation operation)
{
    if (job_)
        return contract::kPLErrorBusy;
    if (!disk || disk->path.empty())
        return contract::kPLErrorNoDiskReference;
    if (!disk->isWhole)
        return contract::kPLErrorUnsupported;
    if (beginPrivileged(Subject::PartitionMap, disk, operation))
        return contract::kPLNoError;
    start(disk, [disk, operation, this](StopSwitch& stop, EventRoad& road) {
        return std::make_unique<MapScript>(disk, operation, options_, texts_, stop, road);
    });
    return contract::kPLNoError;
}

// The volume stays mounted, and need not be claimed: its files are what is looked at.
ErrorCode RepairDisk::beginPermissions(const DiskReferencePointer& disk, Operation operation)
{
    if (job_)
        return contract::kPLErrorBusy;
    if (!disk || disk->path.empty())
        return contract::kPLErrorNoDiskReference;
    if (disk->isWhole || disk->mountPoint.empty() ||
        installedSystemAt(disk->mountPoint) == PackageDatabase::None) {
        if (options_.commandTrace)
            options_.commandTrace(
                texts_.text("the volume is not mounted as the root of a system with a package "
                            "database that is known here"));
        return contract::kPLErrorUnsupported;
    }
    if (beginPrivileged(Subject::Permissions, disk, operation))
        return contract::kPLNoError;
    start(disk, [disk, operation, this](StopSwitch& stop, EventRoad& road) {
        return std::make_unique<PermissionsScript>(disk, operation, options_, texts_, stop, road);
    });
    return contract::kPLNoError;
}

/// What can be said without touching the disk.
ErrorCode RepairDisk::refusal(const DiskReferencePointer& disk, Operation operation) const
{
    if (job_)
        return contract::kPLErrorBusy;
    if (!disk || disk->path.empty())
        return contract::kPLErrorNoDiskReference;
    if (disk->isWhole)
        return contract::kPLErrorUnsupported;
    if (disk->filesystem.empty())
        return contract::kPLNoError;
    const Capability capability = capabilityFor(disk->filesystem, operation, options_.toolPath);
    if (options_.commandTrace)
        options_.commandTrace(
            contract::printable(disk->filesystem) + ": " +
            (capability.isGiven() ? capability.program.string() : capability.reason.in(texts_)));
    return contract::kPLNoError;  // the job itself says why there is no way
}

void RepairDisk::start(const DiskReferencePointer& disk, const ScriptMaker& makeScript)
{
    EventReceiver receiver{&delegate_, disk, options_.commandTrace, [this] {
                               job_.reset();
                           }};
    job_ = std::make_unique<Job>(makeScript, std::move(receiver), loop_);
}

}  // namespace pellar
