// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/history/RecordTable.h"

#include "contract/pellar/MessageKeys.h"

#include <algorithm>

namespace orvane {
namespace {

// A volume's records have the numbers from `volume << recordBits` on.
constexpr int recordBits = 36;
constexpr std::int64_t noRecord = -1;

// In one row; a history is also dropped by whole rows.
constexpr std::size_t mostOfPage = 256;

std::int64_t firstOf(std::int64_t volume)
{
    return volume << recordBits;
}

void bindText(Statement& statement, int parameter, std::string_view text)
{
    if (text.empty())
        statement.bindNothing(parameter);
    else
        statement.bind(parameter, text);
}

std::int64_t milliseconds(RecordTable::Time time)
{
    return std::chrono::duration_cast<std::chrono::milliseconds>(time.time_since_epoch()).count();
}

/// The one number that a statement over a range of records answers; none when it gives no row.
std::int64_t numberIn(Statement& statement, std::int64_t first, std::int64_t end)
{
    statement.bind(1, first);
    statement.bind(2, end);
    const std::int64_t number =
        statement.step() == Statement::Step::Row ? statement.integer(0) : noRecord;
    statement.reset();
    return number;
}

}  // namespace

RecordTable::RecordTable(Database& database, std::int64_t mostOfVolume)
    : mostOfVolume_(mostOfVolume),
      vocabulary_(database),
      add_(database.prepare("INSERT INTO records (id, shape, type, verbosity, message, text, "
                            "style, time, extra, pageRecords, page) "
                            "VALUES (?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?)")),
      read_(database.prepare("SELECT shape, type, verbosity, message, text, style, extra, time, "
                             "page FROM records WHERE id >= ? AND id < ? ORDER BY id")),
      oldest_(
          database.prepare("SELECT id FROM records WHERE id >= ? AND id < ? ORDER BY id LIMIT 1")),
      newest_(database.prepare(
          "SELECT id + ifnull(pageRecords, 0) FROM records WHERE id >= ? AND id < ? "
          "ORDER BY id DESC LIMIT 1")),
      // A summary record, of verbosity -2, closes a run.
      endOfRun_(database.prepare("SELECT id FROM records WHERE id >= ? AND id < ? AND "
                                 "verbosity = -2 ORDER BY id LIMIT 1")),
      remove_(database.prepare("DELETE FROM records WHERE id >= ? AND id < ?"))
{
}

void RecordTable::dropAllSurplus()
{
    const auto surplus = surplus_;
    for (const auto& [volume, end] : surplus)
        static_cast<void>(dropSurplus(volume, end));
}

RecordRange RecordTable::recordsOf(std::int64_t volume)
{
    const std::int64_t first = oldest(volume);
    return first != noRecord ? RecordRange{first, behindNewest(volume)} : RecordRange();
}

bool RecordTable::read(RecordRange records, const contract::Array& history, RecordTimes& times)
{
    read_.bind(1, records.next);
    read_.bind(2, records.end);
    Statement::Step step = Statement::Step::Done;
    while ((step = read_.step()) == Statement::Step::Row) {
        take({read_.integer(0),
              read_.integer(5),
              {read_.text(1), read_.integer(2), read_.text(3), read_.text(4), nullptr,
               read_.text(6)}},
             history);
        for (std::string_view page = read_.text(8); !page.empty();) {
            const auto record = takeFromPage(page);
            if (!record) {
                read_.reset();
                return false;
            }
            take(*record, history);
        }
        times.add(history.size(), Time(std::chrono::milliseconds(read_.integer(7))));
    }
    return step == Statement::Step::Done;
}

void RecordTable::take(const NumberedColumns& record, const contract::Array& history)
{
    RecordColumns columns = record.columns;
    if (record.style != 0)
        columns.style = vocabulary_.style(record.style);
    history.append(recordFrom(columns, vocabulary_.shape(record.shape)));
}

namespace {

// A summary has a row of its own: there a run ends, and a statement looks for such rows.
std::size_t recordsOfFirstPage(std::span<const contract::Value> records)
{
    const auto isSummary = [](const contract::Value& record) {
        return record.dictionary().integer(contract::kFsckVerbosity) ==
               contract::verbosity::summary;
    };
    const auto most = records.first(std::min(records.size(), mostOfPage));
    const auto summary = std::find_if(most.begin(), most.end(), isSummary);
    return std::max<std::size_t>(1, static_cast<std::size_t>(summary - most.begin()));
}

}  // namespace

bool RecordTable::append(std::int64_t volume, const contract::Array& history, std::size_t firstNew,
                         const RecordTimes& times, Time now)
{
    if (!makeRoom(volume, static_cast<std::int64_t>(history.size() - firstNew)))
        return false;
    // The newest ones, when there are more at once than a volume may have.
    const auto limit = static_cast<std::size_t>(mostOfVolume_);
    firstNew = std::max(firstNew, history.size() - std::min(limit, history.size()));
    std::int64_t id = behindNewest(volume);
    auto next = times.stretches.begin();
    std::int64_t time = milliseconds(now);
    for (std::size_t i = firstNew; i < history.size();) {
        for (; next != times.stretches.end() && next->first <= i; ++next)
            time = milliseconds(next->time);
        const std::size_t end =
            next != times.stretches.end() ? std::min(next->first, history.size()) : history.size();
        const std::span together = std::span(history.values()).subspan(i, end - i);
        const std::size_t count = recordsOfFirstPage(together);
        if (!insert(id, together.first(count), time))
            return false;
        id += static_cast<std::int64_t>(count);
        i += count;
    }
    return true;
}

std::optional<NumberedColumns> RecordTable::numbered(const contract::Value& record)
{
    const contract::Dictionary dictionary = record.dictionary();
    const auto* const shape = vocabulary_.shapeOf(dictionary);
    if (shape == nullptr)
        return std::nullopt;
    NumberedColumns result{shape->number, 0, columnsOf(dictionary, shape->shape, extraRoom_)};
    if (result.columns.style != nullptr)
        result.style = vocabulary_.numberOf(result.columns.style);
    const bool isWritten = result.columns.style == nullptr || result.style != 0;
    return isWritten ? std::optional(result) : std::nullopt;
}

bool RecordTable::insert(std::int64_t id, std::span<const contract::Value> records,
                         std::int64_t time)
{
    page_.clear();
    for (const contract::Value& record : records.subspan(1)) {
        const auto columns = numbered(record);
        if (!columns)
            return false;
        addToPage(page_, *columns);
    }
    const auto first = numbered(records.front());
    if (!first)
        return false;
    add_.bind(1, id);
    add_.bind(2, first->shape);
    bindText(add_, 3, first->columns.type);
    add_.bind(4, first->columns.verbosity);
    bindText(add_, 5, first->columns.message);
    bindText(add_, 6, first->columns.text);
    if (first->style != 0)
        add_.bind(7, first->style);
    else
        add_.bindNothing(7);
    add_.bind(8, time);
    bindText(add_, 9, first->columns.extra);
    if (page_.empty())
        add_.bindNothing(10);
    else
        add_.bind(10, static_cast<std::int64_t>(records.size() - 1));
    bindText(add_, 11, page_);
    return add_.run();
}

bool RecordTable::removeAll(std::int64_t volume)
{
    surplus_.erase(volume);
    return remove(firstOf(volume), firstOf(volume + 1));
}

bool RecordTable::remove(std::int64_t first, std::int64_t end)
{
    remove_.bind(1, first);
    remove_.bind(2, end);
    return remove_.run();
}

std::int64_t RecordTable::oldest(std::int64_t volume)
{
    return numberIn(oldest_, firstOf(volume), firstOf(volume + 1));
}

std::int64_t RecordTable::behindNewest(std::int64_t volume)
{
    const std::int64_t newest = numberIn(newest_, firstOf(volume), firstOf(volume + 1));
    return newest != noRecord ? newest + 1 : firstOf(volume);
}

// Where the run that holds the record before `record` ends; `record` when that run goes on to
// the newest record.
std::int64_t RecordTable::endOfRunAt(std::int64_t record, std::int64_t next)
{
    const std::int64_t end = numberIn(endOfRun_, record - 1, next);
    return end != noRecord ? end + 1 : record;
}

// Drops a quarter more than it must, so that a volume at its limit is not trimmed at every save.
bool RecordTable::makeRoom(std::int64_t volume, std::int64_t added)
{
    const std::int64_t first = oldest(volume);
    const std::int64_t next = behindNewest(volume);
    const std::int64_t surplus = next - first + added - mostOfVolume_;
    if (first != noRecord && surplus > 0 && !surplus_.contains(volume))
        surplus_[volume] = endOfRunAt(std::min(next, first + surplus + mostOfVolume_ / 4), next);
    // A million records at once would keep the user waiting.
    constexpr std::int64_t fewestRemoved = 1000;
    return dropSurplus(volume, added + added / 4 + fewestRemoved);
}

bool RecordTable::dropSurplus(std::int64_t volume, std::int64_t most)
{
    const auto surplus = surplus_.find(volume);
    if (surplus == surplus_.end())
        return true;
    const std::int64_t first = oldest(volume);
    const std::int64_t end = std::min(surplus->second, first + most);
    if (end >= surplus->second)
        surplus_.erase(surplus);
    return first == noRecord || remove(first, end);
}

}  // namespace orvane
