// SPDX-License-Identifier: Apache-2.0
#include "pellar/RepairDisk.h"

#include "contract/foundation/UTF8.h"
#include "pellar/jobs/JobObserver.h"
#include "pellar/jobs/LiveVolumeScript.h"
#include "pellar/jobs/PartOfImageScript.h"
#include "pellar/jobs/PartitionMapScript.h"
#include "pellar/jobs/PermissionsScript.h"
#include "pellar/jobs/PermissionsUndoScript.h"
#include "pellar/jobs/UndoScript.h"
#include "pellar/jobs/VolumeScript.h"
#include "pellar/packages/InstalledSystem.h"
#include "pellar/partitions/MapDisk.h"
#include "pellar/tools/Capability.h"
#include "pellar/tools/ToolTable.h"
#include "pellar/undo/PublicIndex.h"

#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <iterator>
#include <memory>
#include <optional>
#include <system_error>
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

/// Whether a device may be neither opened as the task must, nor unmounted, by this user; and
/// whether installed files are to be changed. No password is asked for merely to look at the
/// files of a volume that is mounted: what this user may not see of it is counted and said.
bool needsPrivileges(Task task, const contract::DiskReference& disk, const SystemPaths& paths)
{
    struct stat status = {};
    if (::geteuid() == 0 || ::stat(disk.path.c_str(), &status) != 0 || !S_ISBLK(status.st_mode))
        return false;
    if (task.subject == Subject::Permissions)
        return task.operation != Operation::Verify;
    const bool isRead = accessFor(task.operation) == Access::ReadOnly;
    return ::access(disk.path.c_str(), isRead ? R_OK : R_OK | W_OK) != 0 ||
           !mountsOf(status.st_rdev, paths).empty();
}

/// The newest time of a repair of the disk in a list; none where there is none.
std::optional<std::chrono::system_clock::time_point> newestTimeIn(
    const RecordList& list, Task task, const contract::DiskReference& disk)
{
    RecordList ofSubject;
    std::ranges::copy_if(list.records, std::back_inserter(ofSubject.records),
                         [task](const ListedRecord& record) {
                             return record.facts.repair.task.subject == task.subject;
                         });
    std::error_code error;
    const auto path = std::filesystem::canonical(disk.path, error);
    const ListedRecord* const newest =
        newestOf({error ? disk.path : path, disk.offset, disk.length, {}, {}, {}}, ofSubject);
    return newest != nullptr ? std::optional(newest->facts.repair.time) : std::nullopt;
}

/// Whether the repair that is to be undone was done with the administrator's rights, though this
/// user could do without them by now: because it is not mounted any more.
bool isKeptByAdministrator(Task task, const contract::DiskReference& disk, const Trials& trials)
{
    if (!task.isUndo() || trials.systemDirectory.empty())
        return false;
    const auto index = readPublicIndex(recordIndexIn(trials.systemDirectory));
    const auto theirs = index ? newestTimeIn(*index, task, disk) : std::nullopt;
    if (!theirs)
        return false;
    std::error_code error;
    if (trials.room.directory.empty() || !std::filesystem::exists(recordsIn(trials), error))
        return true;
    const auto store = openRecords(trials);
    const auto ours = store ? newestTimeIn(store->list(), task, disk) : std::nullopt;
    return !ours || *ours < *theirs;
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

bool isMountedAtRoot(const std::vector<Mount>& places)
{
    return std::any_of(places.begin(), places.end(),
                       [](const Mount& place) { return place.target == "/"; });
}

bool answer(bool value, ErrorCode* error)
{
    if (error != nullptr)
        *error = contract::kPLNoError;
    return value;
}

}  // namespace

RepairDisk::RepairDisk(contract::RunLoop& loop, const Texts& texts, const JobOptions& options,
                       contract::PLAsyncDelegate& delegate)
    : loop_(loop), texts_(texts), options_(options), delegate_(delegate)
{
}

ErrorCode RepairDisk::beginStoragesystemFilesystemVerifyForDisk(const DiskReferencePointer& disk)
{
    return begin({Subject::Filesystem, Operation::Verify}, disk);
}

ErrorCode RepairDisk::beginStoragesystemFilesystemRepairForDisk(const DiskReferencePointer& disk)
{
    return begin({Subject::Filesystem, Operation::Repair}, disk);
}

ErrorCode RepairDisk::beginPermissionsVerifyForDisk(const DiskReferencePointer& disk)
{
    return begin({Subject::Permissions, Operation::Verify}, disk);
}

ErrorCode RepairDisk::beginPermissionsRepairForDisk(const DiskReferencePointer& disk)
{
    return begin({Subject::Permissions, Operation::Repair}, disk);
}

ErrorCode RepairDisk::beginPartitionMapVerifyForDisk(const DiskReferencePointer& disk)
{
    return begin({Subject::PartitionMap, Operation::Verify}, disk);
}

ErrorCode RepairDisk::beginPartitionMapRepairForDisk(const DiskReferencePointer& disk)
{
    return begin({Subject::PartitionMap, Operation::Repair}, disk);
}

bool RepairDisk::canRepairPartitionMapForDisk(const DiskReferencePointer& disk, ErrorCode* error)
{
    const bool isDisk = disk && !disk->path.empty() && disk->isWhole;
    // What this user may not read is looked at when the job has the right to.
    const bool isUnknown =
        isDisk && options_.privileged &&
        needsPrivileges({Subject::PartitionMap, Operation::Verify}, *disk, options_.systemPaths);
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
    if (options_.observer != nullptr)
        options_.observer->stopWasAsked();
    if (job_)
        job_->stop();
}

ErrorCode RepairDisk::begin(Task task, const DiskReferencePointer& disk)
{
    JobObserver* const observer = options_.observer;
    if (observer != nullptr)
        observer->jobWillBegin(disk, task);
    const ErrorCode error = beginUnobserved(task, disk);
    if (observer != nullptr && error != contract::kPLNoError)
        observer->jobDidNotBegin(disk, error);
    return error;
}

ErrorCode RepairDisk::beginUnobserved(Task task, const DiskReferencePointer& disk)
{
    if (const ErrorCode error = refusal(task, disk))
        return error;
    if (beginPrivileged(task, disk))
        return contract::kPLNoError;
    if (task.isUndo())
        return beginUndo(task, disk);
    switch (task.subject) {
        case Subject::Filesystem: return beginVolume(disk, task.operation);
        // The disk is claimed by the job: why it cannot be had is then said in the log, where a
        // refusal to begin says nothing.
        case Subject::PartitionMap: startScript<PartitionMapScript>(disk, task.operation); break;
        // The volume stays mounted, and need not be claimed: its files are what is looked at.
        case Subject::Permissions: startScript<PermissionsScript>(disk, task.operation); break;
    }
    return contract::kPLNoError;
}

ErrorCode RepairDisk::beginVolume(const DiskReferencePointer& disk, Operation operation)
{
    auto claim =
        DiskClaim::attempt(*disk, accessFor(operation, policyFor(options_)), options_.systemPaths);
    if (const auto* const error = std::get_if<ErrorCode>(&claim))
        return beginMounted(disk, operation, *error);
    VolumeRequest request{disk, operation, std::nullopt, {}, toolFor(disk->filesystem)};
    // The main thread does not wait: a device that is locked is claimed by the job.
    if (auto* const taken = std::get_if<DiskClaim>(&claim))
        request.claim.emplace(std::move(*taken));
    startVolume(std::move(request));
    return contract::kPLNoError;
}

ErrorCode RepairDisk::beginUndo(Task task, const DiskReferencePointer& disk)
{
    if (task.subject == Subject::Permissions) {
        start(disk, [=, this](StopSwitch& stop, EventQueue& events) {
            return std::make_unique<PermissionsUndoScript>(disk, context(*disk, stop, events));
        });
        return contract::kPLNoError;
    }
    UndoRequest request{task, disk, {}};
    if (task.subject == Subject::Filesystem)
        request.mounts = mountsOf(disk->path, options_.systemPaths);
    if (isMountedAtRoot(request.mounts))
        return contract::kPLErrorCouldNotUnmount;
    start(disk, [=, this](StopSwitch& stop, EventQueue& events) {
        return std::make_unique<UndoScript>(request, context(*disk, stop, events));
    });
    return contract::kPLNoError;
}

/// NO when the job needs no other rights, or there is no way to them.
bool RepairDisk::beginPrivileged(Task task, const DiskReferencePointer& disk)
{
    if (!options_.privileged || (!needsPrivileges(task, *disk, options_.systemPaths) &&
                                 !isKeptByAdministrator(task, *disk, options_.trials)))
        return false;
    const auto& isAllowed = options_.archiveFetching.isAllowed;
    const bool fetches = task.subject == Subject::Permissions && isAllowed && isAllowed();
    const PrivilegedJob job{task, *disk, nullptr, fetches, policyFor(options_)};
    start(disk, [job, this](StopSwitch& stop, EventQueue& events) {
        return options_.privileged(job, stop, events);
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
    const bool isRoot = isMountedAtRoot(mounts);
    const bool staysMounted = isRoot || !options_.unmounts ||
                              holdsDirectory(mounts, options_.homeDirectory, options_.systemPaths);
    if (operation == Operation::Verify && staysMounted && mounts.front().filesystem == "btrfs")
        startScript<LiveVolumeScript>(disk, mounts);
    else if (mounts.empty() || isRoot || !options_.unmounts)
        return error;
    else
        startVolume({disk, operation, std::nullopt, std::move(mounts), toolFor(disk->filesystem)});
    return contract::kPLNoError;
}

template <class JobScript, class Argument>
void RepairDisk::startScript(const DiskReferencePointer& disk, const Argument& argument)
{
    start(disk, [=, this](StopSwitch& stop, EventQueue& events) {
        return std::make_unique<JobScript>(disk, argument, context(*disk, stop, events));
    });
}

// A script maker can be copied, a claim cannot.
void RepairDisk::startVolume(VolumeRequest request)
{
    const auto disk = request.disk;
    const auto shared = std::make_shared<VolumeRequest>(std::move(request));
    start(disk, [=, this](StopSwitch& stop, EventQueue& events) -> std::unique_ptr<Script> {
        if (isPartThatOthersAttach(*shared))
            return std::make_unique<PartOfImageScript>(std::move(*shared),
                                                       context(*disk, stop, events));
        return std::make_unique<VolumeScript>(std::move(*shared), context(*disk, stop, events));
    });
}

JobContext RepairDisk::context(const contract::DiskReference& disk, StopSwitch& stop,
                               EventQueue& events) const
{
    return {disk, options_, texts_, stop, events};
}

/// The user may not attach it, but others may.
bool RepairDisk::isPartThatOthersAttach(const VolumeRequest& request) const
{
    return ::geteuid() != 0 && options_.privileged && request.claim &&
           !request.claim->isBlockDevice() && !request.claim->isAllOfIt();
}

/// What can be said without touching the disk.
ErrorCode RepairDisk::refusal(Task task, const DiskReferencePointer& disk) const
{
    if (job_)
        return contract::kPLErrorBusy;
    if (!disk || disk->path.empty())
        return contract::kPLErrorNoDiskReference;
    if (task.subject == Subject::Permissions)
        return task.operation == Operation::Finish ? contract::kPLErrorUnsupported
                                                   : refusalOfPermissions(*disk);
    if (disk->isWhole != (task.subject == Subject::PartitionMap))
        return contract::kPLErrorUnsupported;
    if (task.subject == Subject::Filesystem && !task.isUndo())
        traceTool(*disk, task.operation);
    return contract::kPLNoError;
}

ErrorCode RepairDisk::refusalOfPermissions(const contract::DiskReference& disk) const
{
    if (!disk.isWhole && !disk.mountPoint.empty() &&
        installedSystemAt(disk.mountPoint) != PackageDatabase::None)
        return contract::kPLNoError;
    trace(
        texts_.text("the volume is not mounted as the root of a system with a package "
                    "database that is known here"));
    return contract::kPLErrorUnsupported;
}

/// Where there is none, the job itself says why.
void RepairDisk::traceTool(const contract::DiskReference& disk, Operation operation) const
{
    if (disk.filesystem.empty())
        return;
    const Capability capability = capabilityFor(disk.filesystem, operation, options_.toolPath,
                                                repairWayFor(options_, policyFor(options_)));
    trace(contract::printable(disk.filesystem) + ": " +
          (capability.isGiven() ? capability.program.string() : capability.reason.in(texts_)));
}

void RepairDisk::trace(const std::string& line) const
{
    if (options_.commandTrace)
        options_.commandTrace(line);
}

void RepairDisk::start(const DiskReferencePointer& disk, const ScriptMaker& makeScript)
{
    EventReceiver receiver{&delegate_, disk, options_.commandTrace, [this] { job_.reset(); },
                           options_.observer};
    job_ = std::make_unique<Job>(makeScript, std::move(receiver), loop_);
}

}  // namespace pellar
