// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/history/RunLedger.h"

#include <algorithm>

namespace orvane {
namespace {

// The sentences are short, so this is some hundred kilobytes at most.
constexpr std::int64_t keptRuns = 1000;

std::int64_t milliseconds(Run::Time time)
{
    return std::chrono::duration_cast<std::chrono::milliseconds>(time.time_since_epoch()).count();
}

Run::Time timeFrom(std::int64_t milliseconds)
{
    return Run::Time(std::chrono::milliseconds(milliseconds));
}

}  // namespace

RunLedger::RunLedger(Database& database)
    : begin_(database.prepare("INSERT INTO runs (volume, started, action) VALUES (?, ?, ?)")),
      end_(database.prepare(
          "UPDATE runs SET finished = ?, verdict = ?, error = ?, message = ? WHERE id = ?")),
      list_(database.prepare("SELECT action, started, finished, verdict, error, message FROM runs "
                             "WHERE volume = ? ORDER BY id DESC LIMIT ?")),
      trim_(database.prepare("DELETE FROM runs WHERE volume = ?1 AND id <= (SELECT id FROM runs "
                             "WHERE volume = ?1 ORDER BY id DESC LIMIT 1 OFFSET ?2)")),
      database_(database)
{
}

bool RunLedger::keepNewest(std::int64_t volume, std::int64_t count)
{
    trim_.bind(1, volume);
    trim_.bind(2, count);
    return trim_.run();
}

std::int64_t RunLedger::begin(std::int64_t volume, std::string_view action, Run::Time started)
{
    begin_.bind(1, volume);
    begin_.bind(2, milliseconds(started));
    begin_.bind(3, action);
    const bool isWritten = keepNewest(volume, keptRuns - 1) && begin_.run();
    return isWritten ? database_.lastInsertedRow() : 0;
}

void RunLedger::end(std::int64_t run, const RunEnd& end, Run::Time finished)
{
    end_.bind(1, milliseconds(finished));
    end_.bind(2, end.verdict);
    end_.bind(3, std::int64_t{end.errorCode});
    end_.bind(4, end.message);
    end_.bind(5, run);
    static_cast<void>(end_.run());
}

std::vector<Run> RunLedger::runs(std::int64_t volume, std::int64_t limit)
{
    list_.bind(1, volume);
    list_.bind(2, limit);
    std::vector<Run> runs;
    while (list_.step() == Statement::Step::Row) {
        Run run{std::string(list_.text(0)), timeFrom(list_.integer(1)), std::nullopt, std::nullopt};
        if (!list_.isNothing(2)) {
            run.finished = timeFrom(list_.integer(2));
            run.end =
                RunEnd{std::string(list_.text(3)), static_cast<std::int32_t>(list_.integer(4)),
                       std::string(list_.text(5))};
        }
        runs.push_back(std::move(run));
    }
    std::reverse(runs.begin(), runs.end());
    return runs;
}

}  // namespace orvane
