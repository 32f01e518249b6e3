// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/history/HistoryStore.h"

#include "orvane/support/settings/ValueJSON.h"

#include <algorithm>
#include <utility>

namespace orvane {
namespace {

using fixwell::Array;
using fixwell::Dictionary;
using fixwell::Value;

// A volume's records have the numbers from `volume << recordBits` on.
constexpr int recordBits = 36;
constexpr std::int64_t noRecord = -1;

std::int64_t firstOf(std::int64_t volume)
{
    return volume << recordBits;
}

}  // namespace

struct HistoryStore::Statements {
    explicit Statements(Database& database)
        : findVolume(database.prepare("SELECT id FROM volumes WHERE key = ?")),
          addVolume(database.prepare("INSERT INTO volumes (key) VALUES (?)")),
          findStyle(database.prepare("SELECT id FROM styles WHERE style = ?")),
          addStyle(database.prepare("INSERT INTO styles (style) VALUES (?)")),
          readStyle(database.prepare("SELECT style FROM styles WHERE id = ?")),
          findShape(database.prepare("SELECT id FROM shapes WHERE shape = ?")),
          addShape(database.prepare("INSERT INTO shapes (shape) VALUES (?)")),
          readShape(database.prepare("SELECT shape FROM shapes WHERE id = ?")),
          add(database.prepare("INSERT INTO records (id, shape, type, verbosity, message, text, "
                               "style, time, extra) VALUES (?, ?, ?, ?, ?, ?, ?, ?, ?)")),
          read(database.prepare("SELECT shape, type, verbosity, message, text, style, extra FROM "
                                "records WHERE id >= ? AND id < ? ORDER BY id")),
          oldest(database.prepare(
              "SELECT id FROM records WHERE id >= ? AND id < ? ORDER BY id LIMIT 1")),
          newest(database.prepare(
              "SELECT id FROM records WHERE id >= ? AND id < ? ORDER BY id DESC LIMIT 1")),
          // A summary record, of verbosity -2, closes a run.
          endOfRun(database.prepare("SELECT id FROM records WHERE id >= ? AND id < ? AND "
                                    "verbosity = -2 ORDER BY id LIMIT 1")),
          remove(database.prepare("DELETE FROM records WHERE id >= ? AND id < ?")),
          runs(database)
    {
    }

    Statement findVolume, addVolume;
    Statement findStyle, addStyle, readStyle;
    Statement findShape, addShape, readShape;
    Statement add, read, oldest, newest, endOfRun, remove;
    RunLedger runs;
};

HistoryStore::HistoryStore(std::filesystem::path file, Limits limits, WarningSink warn)
    : file_(std::move(file)), limits_(limits), warn_(std::move(warn))
{
    open();
}

HistoryStore::~HistoryStore()
{
    // What cannot be dropped now will be when the volume is saved to again.
    const auto surplus = surplus_;
    for (const auto& [volume, end] : surplus)
        static_cast<void>(dropSurplus(volume, end));
}

void HistoryStore::open()
{
    statements_.reset();
    forgetInterned();
    surplus_.clear();
    HistoryDatabase opened = openHistory(file_, warn_);
    database_ = std::move(opened.database);
    isKept_ = opened.isKept;
    if (isKept_)
        checkpointer_.emplace(file_);
    statements_ = std::make_unique<Statements>(database_);
}

void HistoryStore::forgetInterned()
{
    shapes_.clear();
    styleNumbers_.clear();
    stylesRead_.clear();
    shapesRead_.clear();
}

HistoryStore::Mishap HistoryStore::lastMishap() const
{
    return {database_.lastError(), database_.trouble() == Database::Trouble::Damaged};
}

// Always NO, for the caller to pass on.
bool HistoryStore::failedTo(std::string_view attempt, const Mishap& mishap)
{
    // What was interned in a transaction that failed is not in the database.
    forgetInterned();
    if (mishap.isDamage && isKept_) {
        checkpointer_.reset();
        statements_.reset();
        database_ = Database();
        static_cast<void>(setHistoryAside(file_, warn_));
        open();
        ++generation_;
    } else if (!std::exchange(hasWarned_, true)) {
        warn_(cannot(attempt, file_.native(), mishap.reason).message);
    }
    return false;
}

// 0 where the table has no such text.
std::int64_t HistoryStore::found(Statement& find, std::string_view text)
{
    find.bind(1, text);
    if (find.step() != Statement::Step::Row)
        return 0;
    const std::int64_t number = find.integer(0);
    find.reset();
    return number;
}

// 0 where it could not be written.
std::int64_t HistoryStore::interned(Statement& find, Statement& add, std::string_view text)
{
    if (const std::int64_t number = found(find, text))
        return number;
    add.bind(1, text);
    return add.run() ? database_.lastInsertedRow() : 0;
}

// Looking at a volume writes nothing.
std::int64_t HistoryStore::knownVolume(std::string_view key)
{
    return found(statements_->findVolume, key);
}

std::int64_t HistoryStore::volumeNumber(std::string_view key)
{
    return interned(statements_->findVolume, statements_->addVolume, key);
}

std::int64_t HistoryStore::styleNumber(const fixwell::TextStyle* style)
{
    if (const auto known = styleNumbers_.find(style); known != styleNumbers_.end())
        return known->second;
    const std::int64_t number =
        interned(statements_->findStyle, statements_->addStyle, jsonFromStyle(*style).dump());
    if (number != 0)
        styleNumbers_.emplace(style, number);
    return number;
}

// The shape that fitted last fits most often, so it is kept in front.
const HistoryStore::KnownShape* HistoryStore::shapeOf(const Dictionary& record)
{
    const auto known = std::find_if(shapes_.begin(), shapes_.end(), [&](const KnownShape& shape) {
        return shape.shape.fits(record);
    });
    if (known != shapes_.end()) {
        std::rotate(shapes_.begin(), known, known + 1);
        return &shapes_.front();
    }
    KnownShape shape{RecordShape::of(record), 0};
    shape.number = interned(statements_->findShape, statements_->addShape, shape.shape.toJSON());
    if (shape.number == 0)
        return nullptr;
    // A tool that makes up keys without end must not make the search long.
    if (shapes_.size() >= 64)
        shapes_.pop_back();
    shapes_.push_front(std::move(shape));
    return &shapes_.front();
}

const fixwell::TextStyle* HistoryStore::styleNumbered(std::int64_t number)
{
    if (const auto known = stylesRead_.find(number); known != stylesRead_.end())
        return &known->second;
    fixwell::TextStyle style;
    statements_->readStyle.bind(1, number);
    if (statements_->readStyle.step() == Statement::Step::Row) {
        const auto json = nlohmann::json::parse(statements_->readStyle.text(0), nullptr, false);
        statements_->readStyle.reset();
        try {
            style = styleFromJSON(json);
        } catch (const nlohmann::json::exception&) {
            style = {};
        }
    }
    return &stylesRead_.emplace(number, style).first->second;
}

const RecordShape* HistoryStore::shapeNumbered(std::int64_t number)
{
    if (const auto known = shapesRead_.find(number); known != shapesRead_.end())
        return &known->second;
    std::optional<RecordShape> shape;
    statements_->readShape.bind(1, number);
    if (statements_->readShape.step() == Statement::Step::Row) {
        shape = RecordShape::fromJSON(statements_->readShape.text(0));
        statements_->readShape.reset();
    }
    return &shapesRead_.emplace(number, shape.value_or(RecordShape())).first->second;
}

HistoryStore::Range HistoryStore::recordsOf(std::string_view key)
{
    const std::int64_t volume = knownVolume(key);
    const std::int64_t first = volume != 0 ? oldestRecord(volume) : noRecord;
    if (first != noRecord)
        return {first, nextRecord(volume)};
    if (const Mishap mishap = lastMishap(); mishap.isDamage)
        failedTo("read the history", mishap);
    return {};
}

void HistoryStore::load(Range records, const Array& history)
{
    if (records.size() > 0 && !read(records, history))
        failedTo("read the history", lastMishap());
}

bool HistoryStore::read(Range records, const Array& history)
{
    Statement& row = statements_->read;
    row.bind(1, records.next);
    row.bind(2, records.end);
    Statement::Step step = Statement::Step::Done;
    while ((step = row.step()) == Statement::Step::Row) {
        const RecordShape* const shape = shapeNumbered(row.integer(0));
        RecordColumns columns{row.text(1), row.integer(2), row.text(3),
                              row.text(4), nullptr,        row.text(6)};
        if (!row.isNothing(5))
            columns.style = styleNumbered(row.integer(5));
        history.append(recordFrom(columns, *shape));
    }
    return step == Statement::Step::Done;
}

bool HistoryStore::append(std::string_view key, const Array& history, std::size_t firstNew)
{
    // In memory the lists themselves are all there is to keep.
    if (!isKept_ || firstNew >= history.size())
        return true;
    Mishap mishap;
    {
        Transaction transaction(database_);
        const std::int64_t volume = transaction.hasBegun() ? volumeNumber(key) : 0;
        const auto added = static_cast<std::int64_t>(history.size() - firstNew);
        if (volume != 0 && makeRoom(volume, added) && insertAll(volume, history, firstNew) &&
            transaction.commit()) {
            countAdded(added);
            return true;
        }
        // Rolling back would forget it.
        mishap = lastMishap();
    }
    return failedTo("save the history", mishap);
}

std::int64_t HistoryStore::nextRecord(std::int64_t volume)
{
    Statement& newest = statements_->newest;
    newest.bind(1, firstOf(volume));
    newest.bind(2, firstOf(volume + 1));
    const bool hasRecords = newest.step() == Statement::Step::Row;
    const std::int64_t next = hasRecords ? newest.integer(0) + 1 : firstOf(volume);
    newest.reset();
    return next;
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

// Drops a quarter more than it must, so that a volume at its limit is not trimmed at every save.
bool HistoryStore::makeRoom(std::int64_t volume, std::int64_t added)
{
    const std::int64_t first = oldestRecord(volume);
    const std::int64_t next = nextRecord(volume);
    const std::int64_t surplus = next - first + added - limits_.recordsOfVolume;
    if (first != noRecord && surplus > 0 && !surplus_.contains(volume))
        surplus_[volume] =
            endOfRunAt(std::min(next, first + surplus + limits_.recordsOfVolume / 4), next);
    // A million records at once would keep the user waiting.
    constexpr std::int64_t fewestRemoved = 1000;
    return dropSurplus(volume, added + added / 4 + fewestRemoved);
}

std::int64_t HistoryStore::oldestRecord(std::int64_t volume)
{
    Statement& oldest = statements_->oldest;
    oldest.bind(1, firstOf(volume));
    oldest.bind(2, firstOf(volume + 1));
    const std::int64_t record =
        oldest.step() == Statement::Step::Row ? oldest.integer(0) : noRecord;
    oldest.reset();
    return record;
}

// Where the run that holds the record before `record` ends; `record` when that run goes on to
// the newest record.
std::int64_t HistoryStore::endOfRunAt(std::int64_t record, std::int64_t next)
{
    Statement& endOfRun = statements_->endOfRun;
    endOfRun.bind(1, record - 1);
    endOfRun.bind(2, next);
    const bool hasEnd = endOfRun.step() == Statement::Step::Row;
    const std::int64_t end = hasEnd ? endOfRun.integer(0) + 1 : record;
    endOfRun.reset();
    return end;
}

bool HistoryStore::dropSurplus(std::int64_t volume, std::int64_t most)
{
    const auto surplus = surplus_.find(volume);
    if (surplus == surplus_.end())
        return true;
    const std::int64_t first = oldestRecord(volume);
    const std::int64_t end = std::min(surplus->second, first + most);
    if (end >= surplus->second)
        surplus_.erase(surplus);
    if (first == noRecord)
        return true;
    statements_->remove.bind(1, first);
    statements_->remove.bind(2, end);
    return statements_->remove.run();
}

bool HistoryStore::insertAll(std::int64_t volume, const Array& history, std::size_t firstNew)
{
    // The newest ones, when there are more at once than a volume may have.
    const auto limit = static_cast<std::size_t>(limits_.recordsOfVolume);
    firstNew = std::max(firstNew, history.size() - std::min(limit, history.size()));
    const std::int64_t time = std::chrono::duration_cast<std::chrono::milliseconds>(
                                  Run::Time::clock::now().time_since_epoch())
                                  .count();
    std::int64_t id = nextRecord(volume);
    for (std::size_t i = firstNew; i < history.size(); ++i)
        if (!insert(id++, history.values()[i].dictionary(), time))
            return false;
    return true;
}

bool HistoryStore::insert(std::int64_t id, const Dictionary& record, std::int64_t time)
{
    const KnownShape* const shape = shapeOf(record);
    if (shape == nullptr)
        return false;
    const RecordColumns columns = columnsOf(record, shape->shape, extraRoom_);
    const std::int64_t style = columns.style != nullptr ? styleNumber(columns.style) : 0;
    if (columns.style != nullptr && style == 0)
        return false;

    Statement& add = statements_->add;
    const auto bindText = [&add](int parameter, std::string_view text) {
        if (text.empty())
            add.bindNothing(parameter);
        else
            add.bind(parameter, text);
    };
    add.bind(1, id);
    add.bind(2, shape->number);
    bindText(3, columns.type);
    add.bind(4, columns.verbosity);
    bindText(5, columns.message);
    bindText(6, columns.text);
    if (style != 0)
        add.bind(7, style);
    else
        add.bindNothing(7);
    add.bind(8, time);
    bindText(9, columns.extra);
    return add.run();
}

bool HistoryStore::clear(std::string_view key)
{
    const std::int64_t volume = knownVolume(key);
    surplus_.erase(volume);
    statements_->remove.bind(1, firstOf(volume));
    statements_->remove.bind(2, firstOf(volume + 1));
    const bool isCleared =
        volume == 0 || (statements_->remove.run() && statements_->runs.keepNewest(volume, 0));
    return isCleared || failedTo("clear the history", lastMishap());
}

std::int64_t HistoryStore::beginRun(std::string_view key, std::string_view action,
                                    Run::Time started)
{
    const std::int64_t volume = volumeNumber(key);
    const std::int64_t run = volume != 0 ? statements_->runs.begin(volume, action, started) : 0;
    if (run == 0)
        failedTo("note the run in the history", lastMishap());
    return run;
}

void HistoryStore::endRun(std::int64_t run, const RunEnd& end, Run::Time finished)
{
    if (run != 0)
        statements_->runs.end(run, end, finished);
}

std::vector<Run> HistoryStore::runs(std::string_view key)
{
    return statements_->runs.runs(knownVolume(key));
}

std::optional<Run> HistoryStore::lastRun(std::string_view key)
{
    auto newest = statements_->runs.runs(knownVolume(key), 1);
    return newest.empty() ? std::nullopt : std::optional(std::move(newest.back()));
}

}  // namespace orvane
