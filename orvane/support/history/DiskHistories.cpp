// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/history/DiskHistories.h"

#include "fixwell/host/foundation/Dictionary.h"
#include "orvane/support/history/HistoryKey.h"

namespace orvane {

using fixwell::Array;

std::string DiskHistories::keyOf(const DiskFacts& disk)
{
    const auto& owner = identifiersOfUUIDs_.emplace(disk.uuid, disk.identifier).first->second;
    return historyKeyOf(disk, owner != disk.identifier);
}

DiskHistories::History& DiskHistories::find(const DiskFacts& disk)
{
    const std::string key = keyOf(disk);
    const auto known = histories_.find(key);
    if (known != histories_.end())
        return known->second;
    const Array records = store_.load(key);
    return histories_.emplace(key, History{records, records.size(), records.back()}).first->second;
}

Array DiskHistories::historyOf(const DiskFacts& disk)
{
    return find(disk).records;
}

void DiskHistories::replaceHistoryOf(const DiskFacts& disk, const Array& history)
{
    History& kept = find(disk);
    if (!kept.records.isSameAs(history) && store_.clear(keyOf(disk)))
        kept = {history, 0, {}};
}

bool DiskHistories::clearHistoryOf(const DiskFacts& disk)
{
    History& history = find(disk);
    const bool hadRecords = !history.records.isEmpty();
    history.records.removeAll();
    if (store_.clear(keyOf(disk))) {
        history.savedCount = 0;
        history.lastSaved = {};
    }
    return hadRecords;
}

void DiskHistories::saveNew()
{
    if (generation_ != store_.generation()) {
        generation_ = store_.generation();
        for (auto& [key, history] : histories_)
            history.savedCount = 0;
    }
    for (auto& [key, history] : histories_)
        save(key, history);
}

// A list that was emptied and filled again has another record where the last saved one was.
bool DiskHistories::hasOnlyGrown(const History& history)
{
    if (history.savedCount == 0)
        return true;
    const fixwell::Value record = history.records.at(history.savedCount - 1);
    return record.dictionary().isSameAs(history.lastSaved.dictionary());
}

void DiskHistories::save(const std::string& key, History& history)
{
    if (!hasOnlyGrown(history)) {
        if (!store_.clear(key))
            return;
        history.savedCount = 0;
    }
    if (history.savedCount == history.records.size())
        return;
    if (store_.append(key, history.records, history.savedCount)) {
        history.savedCount = history.records.size();
        history.lastSaved = history.records.back();
    }
}

}  // namespace orvane
