// SPDX-License-Identifier: Apache-2.0
#include "orvane/jobs/KeptAmount.h"

#include <chrono>
#include <system_error>

namespace orvane {
namespace {

bool isThere(const pellar::Trials& trials, const std::filesystem::path& directory)
{
    std::error_code error;
    return !trials.room.directory.empty() && std::filesystem::is_directory(directory, error);
}

}  // namespace

KeptAmount keptAmount(const pellar::Trials& trials)
{
    KeptAmount kept;
    if (isThere(trials, recordsIn(trials)))
        if (const auto store = openRecords(trials))
            for (const pellar::ListedRecord& record : store->list().records) {
                ++kept.repairs;
                kept.bytes += record.facts.changedBytes;
                if (record.isInUse || record.isInterrupted())
                    ++kept.lastingRepairs;
            }
    if (isThere(trials, permissionRecordsIn(trials)))
        if (const auto store = openPermissionRecords(trials))
            for (const pellar::ListedPermissionRecord& record : store->list().records) {
                ++kept.repairs;
                if (record.isInUse)
                    ++kept.lastingRepairs;
            }
    return kept;
}

KeptAmount deleteKept(const pellar::Trials& trials)
{
    const auto now = std::chrono::system_clock::now();
    if (isThere(trials, recordsIn(trials)))
        if (const auto store = openRecords(trials))
            store->removeBeyond({}, now);
    if (isThere(trials, permissionRecordsIn(trials)))
        if (const auto store = openPermissionRecords(trials))
            store->removeBeyond({}, now);
    return keptAmount(trials);
}

}  // namespace orvane
