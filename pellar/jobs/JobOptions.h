// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/pellar/DiskReference.h"
#include "pellar/disks/DiskClaim.h"
#include "pellar/jobs/EventQueue.h"
#include "pellar/outcome/Task.h"
#include "pellar/overlay/Overlay.h"
#include "pellar/permissions/PermissionRecords.h"
#include "pellar/process/KernelFiles.h"
#include "pellar/process/ProcessOutput.h"
#include "pellar/process/Stopping.h"
#include "pellar/undo/UndoStore.h"

#include <unistd.h>

#include <chrono>
#include <filesystem>
#include <functional>
#include <memory>
#include <string>
#include <string_view>

namespace pellar {

class JobObserver;

/// What a job does, on the thread that calls `run`. Whatever happens, it tells *started* once,
/// first, and *finished* once, last.
class Script {
public:
    virtual ~Script() = default;
    virtual void run() = 0;
};

/// How one job is to repair.
struct RepairPolicy {
    bool isDirect = false;         ///< the tool writes to the disk itself, which nothing takes back
    bool isPreview = false;        ///< the repair is tried, and not applied
    bool appliesUnproven = false;  ///< it is applied as well where damage would be left
    bool keepsUndo = true;         ///< what it overwrites is kept, so that it can be taken back
    bool isThorough = false;       ///< a verification that finds nothing tries a repair as well
    std::filesystem::path keptImage;  ///< where a preview leaves the repaired volume; or empty

    friend bool operator==(const RepairPolicy&, const RepairPolicy&) = default;
};

/// What it takes to try repairs, and to take them back.
struct Trials {
    /// Where what a tool would write is kept, and, below it, what repairs have overwritten. Without
    /// a directory no repair is tried: the tools write to the disks themselves.
    OverlayRoom room;
    /// Everybody may read which repairs are kept there (PublicIndex).
    bool isPublic = false;
    /// Where the administrator keeps repairs for all; empty where it is the room's directory.
    std::filesystem::path systemDirectory = {};
    /// What may be kept; asked on the job's thread after each repair.
    std::function<RecordLimits()> limits = [] {
        return RecordLimits{20, std::chrono::hours(24 * 90), std::uint64_t{4} << 30U};
    };
    uid_t user = ::geteuid();  ///< who asks, and may take a repair back
    /// Makes a sentence in the user's language about a disk; asked on the job's thread, while the
    /// main thread runs. May be empty, and answer nothing, which is not told.
    using Advice = std::function<std::string(const contract::DiskReference&)>;
    Advice howToUndo;             ///< how a repair is taken back
    Advice howToUndoPermissions;  ///< how one of permissions is
    Advice howToApply;            ///< how one is applied that is not proven
    Advice howToRepairDirectly;   ///< how one is done without a trial
};

inline std::string adviceFor(const contract::DiskReference& disk, const Trials::Advice& advice)
{
    return advice ? advice(disk) : std::string();
}

/// Where the records are of what repairs have overwritten (UndoStore).
inline std::filesystem::path recordsIn(const Trials& trials)
{
    return trials.room.directory / "records";
}

/// What everybody may know of them.
inline std::filesystem::path recordIndexIn(const std::filesystem::path& directory)
{
    return directory / "index";
}

[[nodiscard]] inline Result<UndoStore, Sentence> openRecords(const Trials& trials)
{
    return UndoStore::open(
        recordsIn(trials), ::fsync,
        trials.isPublic ? recordIndexIn(trials.room.directory) : std::filesystem::path());
}

/// Where the records are of the permissions that repairs have changed (PermissionRecords).
inline std::filesystem::path permissionRecordsIn(const Trials& trials)
{
    return trials.room.directory / "permission-records";
}

/// What everybody may know of them.
inline std::filesystem::path permissionIndexIn(const std::filesystem::path& directory)
{
    return directory / "permission-index";
}

[[nodiscard]] inline Result<PermissionRecords, Sentence> openPermissionRecords(const Trials& trials)
{
    return PermissionRecords::open(
        permissionRecordsIn(trials), ::fsync,
        trials.isPublic ? permissionIndexIn(trials.room.directory) : std::filesystem::path());
}

/// A job for which this user has no right: on a block device that they may not open, on files that
/// are not theirs, or on a part of an image that the kernel has to make a device of.
struct PrivilegedJob {
    Task task;
    contract::DiskReference disk;
    /// The image file of which the disk is a part, as this user has opened it: the job may
    /// do no more with it. None for a block device.
    std::shared_ptr<const DiskClaim> image;
    /// The user agrees that archives of packages are fetched (JobOptions::archiveFetching).
    bool fetchesArchives = false;
    RepairPolicy policy = {};
};

/// Makes the script of such a job; empty where there is no way to get the right. Any thread.
using PrivilegedScripts =
    std::function<std::unique_ptr<Script>(const PrivilegedJob&, StopSwitch&, EventQueue&)>;

/// Whether the archives of packages of the running system are fetched over the network, where
/// nothing else says what permissions their files have.
struct ArchiveFetching {
    /// The user agrees. Asked as a job on permissions begins, on the main thread; never when empty.
    std::function<bool()> isAllowed;
    /// A sentence that says how to allow it, in the user's language; told where archives were
    /// missing.
    std::string howToAllow;
};

/// How the library is set up, for all its jobs.
struct JobOptions {
    /// Where tools are looked for: absolute directories, the first that has the tool wins.
    std::string toolPath = "/usr/sbin:/usr/bin:/sbin:/bin";
    /// For one run of a tool.
    OutputLimits outputLimits;
    /// A tool that prints nothing for so long is ended. None when 0: silence is no hang, a volume
    /// with multiple-mount protection alone keeps e2fsck quiet for 11 s.
    std::chrono::milliseconds silenceLimit{0};
    /// Told every command before it runs, and why a tool was chosen or refused. Main thread; may be
    /// empty. Not called after the PLRepairDisk has been destroyed.
    std::function<void(std::string_view)> commandTrace;
    SystemPaths systemPaths;
    /// NO: no job unmounts a volume. One that is mounted is verified there where that is possible,
    /// and no job begins on any other.
    bool unmounts = true;
    /// The user's. The volume that holds it is verified where it is mounted, in the way in which
    /// that is possible, and not unmounted for it. Empty when there is none.
    std::filesystem::path homeDirectory;
    /// Where it is kept what archives have said about their packages' files, so that the next
    /// verification of permissions needs no archive; absolute, made when it is needed, of no use
    /// when others can write to it. Empty: nothing is kept.
    std::filesystem::path permissionReferences;
    ArchiveFetching archiveFetching;
    Trials trials;
    /// Asked as a job begins, on the main thread; may be empty.
    std::function<RepairPolicy()> repairPolicy;
    PrivilegedScripts privileged;
    JobObserver* observer = nullptr;  ///< outlives the manager; none when null
};

inline RepairPolicy policyFor(const JobOptions& options)
{
    return options.repairPolicy ? options.repairPolicy() : RepairPolicy();
}

inline RepairWay repairWayFor(const JobOptions& options, const RepairPolicy& policy)
{
    const bool isTried = !policy.isDirect && !options.trials.room.directory.empty();
    return isTried ? RepairWay::TriedFirst : RepairWay::Direct;
}

/// What a task may do to the disk.
inline Access accessFor(Operation operation, const RepairPolicy& policy = {})
{
    return operation == Operation::Verify || policy.isPreview ? Access::ReadOnly
                                                              : Access::ReadWrite;
}

}  // namespace pellar
