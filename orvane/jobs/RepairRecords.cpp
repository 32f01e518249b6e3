// SPDX-License-Identifier: Apache-2.0
#include "orvane/jobs/RepairRecords.h"

#include "contract/pellar/ErrorCodes.h"
#include "contract/pellar/MessageKeys.h"
#include "pellar/undo/PublicIndex.h"

#include <algorithm>
#include <chrono>
#include <iterator>
#include <system_error>
#include <utility>

namespace orvane {
namespace {

using pellar::ListedRecord;
using pellar::RecordedDisk;

RecordedDisk recordedDisk(const DiskFacts& facts)
{
    std::error_code error;
    const auto path = std::filesystem::canonical(facts.path, error);
    return {error ? facts.path : path, facts.offset, facts.length, facts.uuid,
            facts.filesystem,          facts.name};
}

/// A name passes from one device to the next, and a copy of a volume has its UUID: neither is to be
/// taken for the disk that was repaired.
bool mayBeAnother(const RecordedDisk& repaired, const RecordedDisk& disk)
{
    if (repaired.path == disk.path && repaired.offset != disk.offset)
        return true;
    if (repaired.path == disk.path)
        return !repaired.uuid.empty() && !disk.uuid.empty() && repaired.uuid != disk.uuid;
    std::error_code error;
    return std::filesystem::exists(repaired.path, error) || error;
}

/// As far as its end tells.
bool hasWritten(const Run& run)
{
    return !run.end || run.end->verdict == contract::kPLVerdictRepaired.text() ||
           run.end->errorCode == contract::kPLErrorInterrupted;
}

bool hasNotWritten(const Run& run)
{
    return !hasWritten(run) && (run.end->verdict == contract::kPLVerdictFailed.text() ||
                                run.end->verdict == contract::kPLVerdictStopped.text());
}

}  // namespace

RepairRecords::RepairRecords(const pellar::Trials& trials) : user_(trials.user)
{
    std::error_code error;
    std::vector<ListedRecord> all;
    if (!trials.room.directory.empty() && std::filesystem::is_directory(recordsIn(trials), error))
        if (const auto store = openRecords(trials))
            all = store->list().records;
    if (!trials.systemDirectory.empty())
        addSystemRecords(trials.systemDirectory, all);
    pellar::sortNewestFirst(all, [](const ListedRecord& record) -> const pellar::RecordedRepair& {
        return record.facts.repair;
    });
    for (ListedRecord& record : all) {
        const bool isOfMap = record.facts.repair.task.subject == pellar::Subject::PartitionMap;
        (isOfMap ? ofMaps_ : ofVolumes_).records.push_back(std::move(record));
    }
    if (user_ == 0 && !trials.room.directory.empty() &&
        std::filesystem::is_directory(permissionRecordsIn(trials), error))
        readPermissionRecords(trials);
}

void RepairRecords::addSystemRecords(const std::filesystem::path& directory,
                                     std::vector<ListedRecord>& all)
{
    auto repairs = pellar::readPublicIndex(pellar::recordIndexIn(directory));
    if (repairs)
        std::ranges::move(repairs->records, std::back_inserter(all));
    auto permissions = pellar::readPublicIndex(pellar::permissionIndexIn(directory));
    if (permissions)
        ofPermissions_ = std::move(*permissions);
    knowsAll_ = repairs && permissions;
}

/// Only root can repair permissions, so only root has any of its own.
void RepairRecords::readPermissionRecords(const pellar::Trials& trials)
{
    const auto store = openPermissionRecords(trials);
    if (!store)
        return;
    for (const pellar::ListedPermissionRecord& record : store->list().records) {
        pellar::RecordFacts facts;
        facts.repair = record.run.repair;
        facts.state = pellar::RecordState::Applied;
        ofPermissions_.records.push_back({record.id, std::move(facts), record.isInUse});
    }
}

const ListedRecord* RepairRecords::newestOf(const DiskFacts& disk) const
{
    const RecordedDisk wanted = recordedDisk(disk);
    const ListedRecord* const newest =
        pellar::newestOf(wanted, disk.isWhole ? ofMaps_ : ofVolumes_);
    if (newest == nullptr)
        return nullptr;
    return mayBeAnother(newest->facts.repair.disk, wanted) ? nullptr : newest;
}

// As the job finds it, which also knows where the system was mounted.
const ListedRecord* RepairRecords::newestOfPermissions(const DiskFacts& disk) const
{
    const RecordedDisk wanted = recordedDisk(disk);
    const auto found =
        std::ranges::find_if(ofPermissions_.records, [&wanted](const ListedRecord& record) {
            const RecordedDisk& repaired = record.facts.repair.disk;
            return repaired.uuid == wanted.uuid &&
                   (!wanted.uuid.empty() || repaired.path == wanted.path);
        });
    return found == ofPermissions_.records.end() ? nullptr : &*found;
}

bool RepairRecords::isUsers(const ListedRecord& record) const
{
    return user_ == 0 || record.facts.repair.user == user_;
}

bool RepairRecords::hasInterrupted() const
{
    const auto isInterrupted = [](const pellar::RecordList& list) {
        return std::ranges::any_of(list.records, &ListedRecord::isInterrupted);
    };
    return isInterrupted(ofVolumes_) || isInterrupted(ofMaps_);
}

// The record's time is kept in whole seconds, so it may lie before the run's, and other runs may
// lie in the same second.
const Run* runOf(const pellar::RecordedRepair& repair, const std::vector<Run>& runs)
{
    const Run* possible = nullptr;
    for (const Run& run : runs) {
        const bool isInTime =
            std::chrono::floor<std::chrono::seconds>(run.started) <= repair.time &&
            (!run.finished || repair.time <= *run.finished);
        if (!isInTime || run.action != nameOf(repair.task) || hasNotWritten(run))
            continue;
        if (possible == nullptr || hasWritten(run) || !hasWritten(*possible))
            possible = &run;
    }
    return possible;
}

}  // namespace orvane
