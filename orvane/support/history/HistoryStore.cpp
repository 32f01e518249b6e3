// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/history/HistoryStore.h"

#include "orvane/support/history/HistoryDatabase.h"

#include <utility>

namespace orvane {

using contract::Array;

HistoryStore::Tables::Tables(Database& database, const Limits& limits)
    : volumes(database, "volumes", "key"), records(database, limits.recordsOfVolume), runs(database)
{
}

HistoryStore::HistoryStore(std::filesystem::path file, Limits limits, WarningSink warn)
    : file_(std::move(file)), limits_(limits), warn_(std::move(warn))
{
    open();
}

HistoryStore::~HistoryStore()
{
    writeLate();
    tables_->records.dropAllSurplus();
}

void HistoryStore::open()
{
    tables_.reset();
    HistoryDatabase opened = openHistory(file_, warn_);
    database_ = std::move(opened.database);
    isKept_ = opened.isKept;
    if (isKept_)
        checkpointer_.emplace(file_);
    tables_ = std::make_unique<Tables>(database_, limits_);
}

HistoryStore::Mishap HistoryStore::lastMishap()
{
    Mishap mishap{database_.lastError(), database_.trouble() == Database::Trouble::Damaged};
    database_.forgetError();
    return mishap;
}

// Always NO, for the caller to pass on.
bool HistoryStore::failedTo(const std::string& attempt, const Mishap& mishap)
{
    tables_->records.forgetWritten();
    if (mishap.isDamage && isKept_) {
        checkpointer_.reset();
        tables_.reset();
        database_ = Database();
        static_cast<void>(setHistoryAside(file_, warn_));
        open();
        ++generation_;
    } else if (!std::exchange(hasWarned_, true)) {
        warn_(cannot(attempt, file_.native(), mishap.reason).message);
    }
    return false;
}

RecordRange HistoryStore::recordsOf(std::string_view key)
{
    const std::int64_t volume = tables_->volumes.find(key);
    const RecordRange records = volume != 0 ? tables_->records.recordsOf(volume) : RecordRange();
    if (records.size() > 0)
        return records;
    if (const Mishap mishap = lastMishap(); mishap.isDamage)
        failedTo("read the history", mishap);
    return {};
}

void HistoryStore::load(RecordRange records, const Array& history, RecordTimes& times)
{
    if (records.size() == 0 || tables_->records.read(records, history, times))
        return;
    // A page that makes no sense is none of SQLite's troubles.
    const bool isDamage = database_.trouble() == Database::Trouble::None;
    Mishap mishap = lastMishap();
    mishap.isDamage = mishap.isDamage || isDamage;
    failedTo("read the history", mishap);
}

bool HistoryStore::append(std::string_view key, const Array& history, std::size_t firstNew,
                          const RecordTimes& times)
{
    // In memory the lists themselves are all there is to keep.
    if (!isKept_ || firstNew >= history.size())
        return true;
    Mishap mishap;
    {
        Transaction transaction(database_);
        const std::int64_t volume = transaction.hasBegun() ? tables_->volumes.intern(key) : 0;
        if (volume != 0 &&
            tables_->records.append(volume, history, firstNew, times, Run::Time::clock::now()) &&
            transaction.commit()) {
            writeLate();
            countAdded(static_cast<std::int64_t>(history.size() - firstNew));
            return true;
        }
        // Rolling back would forget it.
        mishap = lastMishap();
    }
    return failedTo("save the history", mishap);
}

void HistoryStore::countAdded(std::int64_t records)
{
    constexpr std::int64_t recordsOfACheckpoint = 50'000;  // a few megabytes
    addedSinceCheckpoint_ += records;
    if (addedSinceCheckpoint_ < recordsOfACheckpoint || !checkpointer_)
        return;
    addedSinceCheckpoint_ = 0;
    checkpointer_->request();
}

bool HistoryStore::clear(std::string_view key)
{
    ++runsRevision_;
    const std::int64_t volume = tables_->volumes.find(key);
    const bool isCleared =
        volume == 0 || (tables_->records.removeAll(volume) && tables_->runs.keepNewest(volume, 0));
    return isCleared || failedTo("clear the history", lastMishap());
}

std::int64_t HistoryStore::beginRun(std::string_view key, std::string_view action,
                                    Run::Time started)
{
    if (const std::int64_t run = noteBegin(key, action, started))
        return run;
    const bool isLocked = database_.trouble() == Database::Trouble::Locked;
    failedTo("note the run in the history", lastMishap());
    if (!isLocked)
        return 0;
    late_.push_back({0, std::string(key), std::string(action), started, std::nullopt, {}});
    return -static_cast<std::int64_t>(late_.size());
}

std::int64_t HistoryStore::noteBegin(std::string_view key, std::string_view action,
                                     Run::Time started)
{
    ++runsRevision_;
    database_.forgetError();
    const std::int64_t volume = tables_->volumes.intern(key);
    return volume != 0 ? tables_->runs.begin(volume, action, started) : 0;
}

void HistoryStore::endRun(std::int64_t run, const RunEnd& end, Run::Time finished)
{
    ++runsRevision_;
    if (run > 0 && !tables_->runs.end(run, end, finished))
        late_.push_back({run, {}, {}, {}, end, finished});
    if (run < 0) {
        LateRun& late = late_.at(static_cast<std::size_t>(-run - 1));
        late.end = end;
        late.finished = finished;
        writeLate();
    }
}

// The list only grows: its places are the numbers of runs that have none in the database yet.
void HistoryStore::writeLate()
{
    for (LateRun& late : late_) {
        if (!late.end)
            continue;
        if (late.run == 0)
            late.run = noteBegin(late.key, late.action, late.started);
        ++runsRevision_;
        if (late.run == 0 || !tables_->runs.end(late.run, *late.end, late.finished))
            return;
        late.end.reset();
    }
}

// The number changes with every commit of another connection (https://sqlite.org/pragma.html,
// data_version).
bool HistoryStore::hasForeignChanges()
{
    Statement question = database_.prepare("PRAGMA data_version");
    if (!isKept_ || !question.isPrepared() || question.step() != Statement::Step::Row)
        return false;
    const std::int64_t version = question.integer(0);
    const bool isForeign = std::exchange(dataVersion_, version) != version;
    if (isForeign)
        ++runsRevision_;
    return isForeign;
}

std::vector<Run> HistoryStore::runs(std::string_view key)
{
    return tables_->runs.runs(tables_->volumes.find(key));
}

std::optional<Run> HistoryStore::lastRun(std::string_view key)
{
    auto newest = tables_->runs.runs(tables_->volumes.find(key), 1);
    return newest.empty() ? std::nullopt : std::optional(std::move(newest.back()));
}

}  // namespace orvane
