// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/history/DiskHistories.h"

#include "contract/foundation/Dictionary.h"
#include "orvane/support/history/RunStart.h"

#include <algorithm>
#include <iterator>
#include <utility>

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

void RunStarts::take(const Array& records, const RecordTimes& times)
{
    const std::size_t end = std::min(records.size(), times.count);
    auto next = times.stretches.begin();
    for (; taken_ < end; ++taken_) {
        const contract::Dictionary record = records.values()[taken_].dictionary();
        if (!isStartOfRun(record))
            continue;
        while (next != times.stretches.end() && next->first <= taken_)
            ++next;
        if (next != times.stretches.begin())
            list_.push_back({record, std::prev(next)->time});
    }
}

void RunStarts::insertInFront(const RunStarts& older)
{
    list_.insert(list_.begin(), older.list_.begin(), older.list_.end());
    taken_ += older.taken_;
}

std::optional<Run> runBegunAt(const std::vector<RunStarts::Start>& starts, std::size_t index,
                              const std::vector<Run>& runs)
{
    // Only a slow disk lies between the two.
    constexpr std::chrono::minutes longestSaving{1};
    const auto first = starts[index].time;
    const auto end = index + 1 < starts.size() && starts[index + 1].time > first
                         ? starts[index + 1].time
                         : RecordTimes::Time::max();
    const auto found = std::find_if(runs.begin(), runs.end(), [&](const Run& run) {
        return run.started >= first && run.started < end && run.started - first <= longestSaving;
    });
    return found == runs.end() ? std::nullopt : std::optional(*found);
}

std::string DiskHistories::keyOf(const DiskFacts& disk)
{
    if (disk.storage == contract::DiskReference::Storage::FileRegion)
        return historyKeyOf(disk, true);
    auto owner = identifiersOfUUIDs_.find(disk.uuid);
    if (owner == identifiersOfUUIDs_.end()) {
        const auto devices = devices_ ? devices_(disk.uuid) : std::vector<std::string>();
        const std::string& first = devices.empty() ? disk.identifier : devices.front();
        owner = identifiersOfUUIDs_.emplace(disk.uuid, first).first;
    }
    return historyKeyOf(disk, owner->second != disk.identifier);
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
    const bool isGradual = isIncomplete_ && all.size() > newestRecords_;
    const std::int64_t first = isGradual ? all.end - newestRecords_ : all.next;
    History history;
    history.records = Array::make();
    store_.load({first, all.end}, history.records, history.times);
    history.savedCount = history.records.size();
    history.endInStore = all.end;
    history.lastSaved = history.records.back();
    history.starts.take(history.records, history.times);
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
    older.starts.take(older.records, older.times);
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
    history.starts.insertInFront(history.older->starts);
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

const std::vector<Run>& DiskHistories::runsOf(const std::string& key)
{
    KnownRuns& known = knownRuns_[key];
    const std::uint64_t revision = store_.runsRevision() + 1;
    if (std::exchange(known.revision, revision) != revision)
        known.runs = store_.runs(key);
    return known.runs;
}

std::optional<std::size_t> DiskHistories::placeOf(const contract::Dictionary& start,
                                                  const std::string& key)
{
    const auto history = histories_.find(key);
    if (history == histories_.end())
        return std::nullopt;
    const auto& list = history->second.starts.list();
    const auto isThere = [&](std::size_t place) {
        return place < list.size() && list[place].record.isSameAs(start);
    };
    for (const std::size_t place : {lastPlace_, lastPlace_ + 1, lastPlace_ - 1})
        if (isThere(place))
            return place;
    for (std::size_t place = list.size(); place-- > 0;)
        if (isThere(place))
            return place;
    return std::nullopt;
}

std::optional<RunOfRecord> DiskHistories::runOf(const contract::Dictionary& start)
{
    auto place = placeOf(start, lastKey_);
    for (auto history = histories_.begin(); !place && history != histories_.end(); ++history)
        if ((place = placeOf(start, history->first)))
            lastKey_ = history->first;
    if (!place)
        return std::nullopt;
    lastPlace_ = *place;
    const auto& starts = histories_.at(lastKey_).starts.list();
    return RunOfRecord{starts[*place].time, runBegunAt(starts, *place, runsOf(lastKey_))};
}

bool DiskHistories::isNewestStart(const contract::Dictionary& start) const
{
    return std::any_of(histories_.begin(), histories_.end(), [&start](const auto& entry) {
        const auto& list = entry.second.starts.list();
        return !list.empty() && list.back().record.isSameAs(start);
    });
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
    history.starts = {};
    history.older.reset();
    if (store_.clear(key)) {
        history.savedCount = 0;
        history.lastSaved = {};
        history.endInStore = store_.recordsOf(key).end;
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
    history.starts = {};
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

// Only what is saved completely is let go; it is read again when it is asked for. That the store
// keeps fewer records of a long history than there are in memory is no change of another's.
bool DiskHistories::takeInOthers()
{
    saveNew();
    const std::size_t others = std::erase_if(histories_, [this](const auto& entry) {
        const auto& [key, history] = entry;
        const bool isSaved = history.savedCount == history.records.size();
        return isSaved && store_.recordsOf(key).end != history.endInStore;
    });
    if (others > 0)
        ++revision_;
    return others > 0;
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
        history.starts = {};
    }
    history.times.add(history.records.size(), now);
    history.starts.take(history.records, history.times);
    if (history.savedCount == history.records.size())
        return;
    if (store_.append(key, history.records, history.savedCount, history.times)) {
        history.savedCount = history.records.size();
        history.lastSaved = history.records.back();
        history.endInStore = store_.recordsOf(key).end;
    }
}

}  // namespace orvane
