// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/history/DiskHistories.h"

#include "contract/foundation/Dictionary.h"

#include <algorithm>

namespace orvane {

std::string historyKeyOf(const DiskFacts& disk, bool sharesUUID)
{
    if (disk.uuid.empty())
        return "disk:" + disk.identifier + "@" + std::to_string(disk.offset);
    const bool isInImage = disk.storage == contract::DiskReference::Storage::FileRegion;
    if (isInImage || sharesUUID)
        return "uuid:" + disk.uuid + "@" + disk.identifier;
    return "uuid:" + disk.uuid;
}

using contract::Array;

namespace {

// A few milliseconds' worth; more than fits into a window.
constexpr std::int64_t recordsAtOnce = 4000;

}  // namespace

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
    return histories_.emplace(key, load(key)).first->second;
}

DiskHistories::History DiskHistories::load(const std::string& key)
{
    const RecordRange all = store_.recordsOf(key);
    const bool isGradual = isIncomplete_ && all.size() > recordsAtOnce;
    const std::int64_t first = isGradual ? all.end - recordsAtOnce : all.next;
    History history;
    history.records = Array::make();
    store_.load({first, all.end}, history.records, history.times);
    history.savedCount = history.records.size();
    history.lastSaved = history.records.back();
    if (isGradual) {
        history.older = {Array::make(), {}, {all.next, first}};
        isIncomplete_();
    }
    return history;
}

DiskHistories::Progress DiskHistories::loadMore()
{
    const auto found = std::find_if(histories_.begin(), histories_.end(),
                                    [](const auto& entry) { return entry.second.older; });
    if (found == histories_.end())
        return Progress::Nothing;
    Older& older = *found->second.older;
    const std::int64_t end = std::min(older.left.end, older.left.next + recordsAtOnce);
    store_.load({older.left.next, end}, older.records, older.times);
    older.left.next = end;
    if (older.left.size() > 0)
        return Progress::More;
    complete(found->second);
    ++revision_;
    return Progress::Completed;
}

bool DiskHistories::loadAll()
{
    bool wasIncomplete = false;
    while (loadMore() != Progress::Nothing)
        wasIncomplete = true;
    return wasIncomplete;
}

void DiskHistories::complete(History& history)
{
    const Array all = history.older->records;
    history.savedCount += all.size();
    history.times.insertInFront(history.older->times);
    all.append(history.records);
    history.records = all;
    history.older.reset();
}

Array DiskHistories::historyOf(const DiskFacts& disk)
{
    return find(disk).records;
}

const RecordTimes& DiskHistories::timesOf(const DiskFacts& disk)
{
    return find(disk).times;
}

void DiskHistories::replaceHistoryOf(const DiskFacts& disk, const Array& history)
{
    History& kept = find(disk);
    if (kept.records.isSameAs(history) || !store_.clear(keyOf(disk)))
        return;
    kept = {};
    kept.records = history;
}

bool DiskHistories::clearHistoryOf(const DiskFacts& disk)
{
    const std::string key = keyOf(disk);
    History& history = find(disk);
    auto runs = store_.runs(key);
    const bool hadAny = !history.records.isEmpty() || !runs.empty();
    if (remembersCleared_ && hadAny)
        remember(key, history, std::move(runs));
    history.records.removeAll();
    history.times = {};
    history.older.reset();
    if (store_.clear(key)) {
        history.savedCount = 0;
        history.lastSaved = {};
    }
    return hadAny;
}

void DiskHistories::remember(const std::string& key, History& history, std::vector<Run> runs)
{
    history.times.add(history.records.size(), RecordTimes::Time::clock::now());
    Cleared cleared{key, Array::make(), history.times, std::move(runs), clearing_};
    if (history.older) {
        store_.load(history.older->left, history.older->records, history.older->times);
        cleared.records.append(history.older->records);
        cleared.times.insertInFront(history.older->times);
    }
    cleared.records.append(history.records);
    cleared_.push_back(std::move(cleared));
}

void DiskHistories::restoreCleared()
{
    saveNew();
    const std::uint64_t last = cleared_.empty() ? 0 : cleared_.back().clearing;
    for (; !cleared_.empty() && cleared_.back().clearing == last; cleared_.pop_back())
        restore(cleared_.back());
    ++revision_;
}

void DiskHistories::restore(const Cleared& cleared)
{
    History& history = histories_[cleared.key];
    const Array all = Array::make();
    all.append(cleared.records);
    if (history.records)
        all.append(history.records);
    history.times.insertInFront(cleared.times);
    history.records = all;
    const auto newer = store_.runs(cleared.key);
    if (!store_.clear(cleared.key))
        return;
    history.savedCount = 0;
    for (const auto* const runs : {&cleared.runs, &newer})
        for (const Run& run : *runs) {
            const std::int64_t number = store_.beginRun(cleared.key, run.action, run.started);
            if (run.end)
                store_.endRun(number, *run.end, run.finished.value_or(run.started));
        }
    save(cleared.key, history, RecordTimes::Time::clock::now());
}

void DiskHistories::saveNew()
{
    if (generation_ != store_.generation()) {
        generation_ = store_.generation();
        for (auto& [key, history] : histories_) {
            history.savedCount = 0;
            history.older.reset();
        }
    }
    // One time for all: what came together stays together.
    const auto now =
        std::chrono::time_point_cast<std::chrono::milliseconds>(RecordTimes::Time::clock::now());
    for (auto& [key, history] : histories_)
        save(key, history, now);
}

// A list that was emptied and filled again has another record where the last saved one was.
bool DiskHistories::hasOnlyGrown(const History& history)
{
    if (history.savedCount == 0)
        return true;
    const contract::Value record = history.records.at(history.savedCount - 1);
    return record.dictionary().isSameAs(history.lastSaved.dictionary());
}

void DiskHistories::save(const std::string& key, History& history, RecordTimes::Time now)
{
    if (!hasOnlyGrown(history)) {
        if (!store_.clear(key))
            return;
        history.savedCount = 0;
        history.times = {};
    }
    history.times.add(history.records.size(), now);
    if (history.savedCount == history.records.size())
        return;
    if (store_.append(key, history.records, history.savedCount, history.times)) {
        history.savedCount = history.records.size();
        history.lastSaved = history.records.back();
    }
}

}  // namespace orvane
