// SPDX-License-Identifier: Apache-2.0
#include "orvane/jobs/RepairRecords.h"

#include "contract/pellar/ErrorCodes.h"
#include "contract/pellar/MessageKeys.h"

#include <algorithm>
#include <chrono>
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
    return {error ? facts.path : path, facts.offset, facts.length, facts.uuid, facts.filesystem,
            facts.name};
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
    const auto directory = recordsIn(trials);
    if (trials.room.directory.empty() || !std::filesystem::is_directory(directory, error))
        return;
    const auto store = pellar::UndoStore::open(directory);
    if (!store)
        return;
    pellar::RecordList all = store->list();
    for (ListedRecord& record : all.records) {
        const bool isOfMap = record.facts.repair.task.subject == pellar::Subject::PartitionMap;
        (isOfMap ? ofMaps_ : ofVolumes_).records.push_back(std::move(record));
    }
}

const ListedRecord* RepairRecords::newestOf(const DiskFacts& disk) const
{
    const RecordedDisk wanted = recordedDisk(disk);
    const ListedRecord* const newest =
        pellar::newestOf(wanted, disk.isWhole ? ofMaps_ : ofVolumes_);
    if (newest == nullptr)
        return nullptr;
    // An older one is of no use before the newest was undone.
    const pellar::RecordedRepair& repair = newest->facts.repair;
    const bool isUsers = user_ == 0 || repair.user == user_;
    return isUsers && !mayBeAnother(repair.disk, wanted) ? newest : nullptr;
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
        const bool isInTime = std::chrono::floor<std::chrono::seconds>(run.started) <= repair.time &&
                              (!run.finished || repair.time <= *run.finished);
        if (!isInTime || run.action != nameOf(repair.task) || hasNotWritten(run))
            continue;
        if (possible == nullptr || hasWritten(run) || !hasWritten(*possible))
            possible = &run;
    }
    return possible;
}

}  // namespace orvane
