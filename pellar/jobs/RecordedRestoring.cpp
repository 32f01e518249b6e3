// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/RecordedRestoring.h"

#include "contract/foundation/UTF8.h"
#include "pellar/jobs/RecordedWriting.h"
#include "pellar/permissions/TakingBack.h"

#include <fcntl.h>

#include <algorithm>
#include <chrono>
#include <system_error>

namespace pellar {
namespace {

/// Each takes a descriptor while it waits, of which a process has a thousand.
constexpr std::size_t mostWaiting = 64;

bool wasTouched(const Restoring& restoring)
{
    if (const auto* const changed = std::get_if<ChangedMeanwhile>(&restoring))
        return changed->wasTouched;
    if (const auto* const foreign = std::get_if<ForeignContents>(&restoring))
        return foreign->wasTouched;
    return !std::holds_alternative<SuspiciousLink>(restoring);
}

/// None when nothing was done to the file, or when that is no longer to be seen.
std::optional<FileState> stateAfter(const Restoring& restoring, const FoundFile& file)
{
    struct stat status = {};
    const auto permissions =
        wasTouched(restoring) ? permissionsOf(file.object.get(), status) : std::nullopt;
    return permissions ? std::optional(stateOf(*permissions, status)) : std::nullopt;
}

Sentence notKept(int error)
{
    return {"nothing more is changed: how the files were could not be kept: %1$@",
            std::generic_category().message(error),
            {}};
}

}  // namespace

PermissionsRun permissionsRunOn(const contract::DiskReference& disk, const RootDirectory& root,
                                const JobContext& context)
{
    const FileDescriptor device(::open(disk.path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC));
    PermissionsRun run;
    run.repair = {recordedDisk(disk, device.get(), {disk.offset, disk.length}),
                  {Subject::Permissions, Operation::Repair},
                  context.options.trials.user,
                  std::chrono::system_clock::now()};
    run.mountPoint = disk.mountPoint;
    run.rootDevice = deviceOf(root);
    return run;
}

bool RecordedRestoring::isToBeRecorded() const
{
    return context_.policy.keepsUndo && !context_.options.trials.room.directory.empty();
}

bool RecordedRestoring::isWaiting(const FoundFile& file) const
{
    return file.status.st_nlink > 1 && std::ranges::any_of(waiting_, [&](const Waiting& waiting) {
               return waiting.file.status.st_dev == file.status.st_dev &&
                      waiting.file.status.st_ino == file.status.st_ino;
           });
}

void RecordedRestoring::add(const Reference& reference, FoundFile file)
{
    waiting_.push_back({&reference, std::move(file)});
    if (waiting_.size() == mostWaiting)
        carryOut();
}

void RecordedRestoring::carryOut()
{
    const std::vector<Waiting> batch = std::exchange(waiting_, {});
    if (batch.empty() || !failure_.isEmpty() || context_.stop.isPressed())
        return;
    if (isToBeRecorded())
        return restoreRecorded(batch);
    for (const Waiting& waiting : batch)
        if (!context_.stop.isPressed())
            static_cast<void>(restoreOne(waiting));
}

void RecordedRestoring::record(const std::vector<Waiting>& batch)
{
    if (!record_) {
        const auto records = openPermissionRecords(context_.options.trials);
        if (!records)
            return failWith(records.error());
        auto begun = records->begin(permissionsRunOn(*disk_, root_, context_));
        if (!begun)
            return failWith(notKept(begun.error()));
        record_.emplace(*std::move(begun));
    }
    std::vector<RecordedChange> changes;
    for (const Waiting& waiting : batch)
        changes.push_back(changeOf(*waiting.reference, waiting.file));
    if (const int error = record_->add(changes))
        failWith(notKept(error));
}

void RecordedRestoring::restoreRecorded(const std::vector<Waiting>& batch)
{
    record(batch);
    if (!failure_.isEmpty())
        return;
    std::size_t place = record_->changes().size() - batch.size();
    for (const Waiting& waiting : batch) {
        const bool isStopped = context_.stop.isPressed() || !failure_.isEmpty();
        const auto after = isStopped ? std::nullopt : stateAfter(restoreOne(waiting), waiting.file);
        // A file that was touched and is as before again, all the same, was not changed.
        const bool isChanged = after && *after != record_->changes()[place].before;
        const int error = isChanged ? record_->note(place, ChangeStage::Changed, after)
                                    : record_->note(place, ChangeStage::Settled);
        if (error != 0 && failure_.isEmpty())
            failWith(notKept(error));
        ++place;
    }
}

Restoring RecordedRestoring::restoreOne(const Waiting& waiting)
{
    const Restoring restoring = restore(root_, *waiting.reference, waiting.file);
    tell(restoring, contract::printable(waiting.reference->path));
    return restoring;
}

void RecordedRestoring::tell(const Restoring& restoring, const std::string& path)
{
    if (std::holds_alternative<Restored>(restoring)) {
        ++restored_;
        log_.detail(Sentence{"“%1$@” was set right.", path, {}});
    } else if (const auto* const refusal = std::get_if<NotPermitted>(&restoring)) {
        log_.problem(Sentence{"“%1$@” cannot be set right: %2$@.", path,
                              std::generic_category().message(refusal->error)});
    } else if (std::holds_alternative<SuspiciousLink>(restoring)) {
        log_.problem(
            Sentence{"“%1$@” has other names too, and lies where others can "
                     "write; it was left alone.",
                     path,
                     {}});
    } else {
        log_.problem(
            Sentence{"“%1$@” changed while it was looked at, and was left alone.", path, {}});
    }
}

void RecordedRestoring::failWith(const Sentence& reason)
{
    failure_ = reason;
    log_.error(failure_);
}

void RecordedRestoring::finish()
{
    if (!record_)
        return;
    const bool isKept = std::ranges::any_of(record_->changes(), [](const RecordedChange& change) {
        return change.stage != ChangeStage::Settled;
    });
    const int error = isKept ? record_->sync() : record_->remove();
    record_.reset();
    if (error != 0)
        return log_.error(notKept(error));
    const Trials& trials = context_.options.trials;
    if (const auto records = openPermissionRecords(trials))
        records->removeBeyond(trials.limits(), std::chrono::system_clock::now());
    if (isKept)
        context_.advise(trials.howToUndoPermissions);
}

}  // namespace pellar
