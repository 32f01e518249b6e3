// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/history/RunTable.h"

#include "orvane/support/files/WholeFile.h"

#include <unistd.h>

#include <algorithm>
#include <sstream>

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

/// When the process began, in clock ticks since the start of the system (proc(5), /proc/PID/stat,
/// field 22); empty when there is none.
std::string startOfProcess(const std::string& process)
{
    const auto stat = readWholeFile("/proc/" + process + "/stat", 4096);
    // The second field is a name that may hold anything, blanks and parentheses too.
    std::istringstream fields(stat ? stat->substr(stat->rfind(')') + 1) : "");
    std::string field;
    for (int number = 3; number <= 22; ++number)
        if (!(fields >> field))
            return {};
    return field;
}

std::string startOfSystem()
{
    const auto id = readWholeFile("/proc/sys/kernel/random/boot_id", 100);
    return id ? id->substr(0, id->find('\n')) : std::string();
}

/// Never the same for two processes.
std::string ownIdentity()
{
    return startOfSystem() + ' ' + std::to_string(::getpid()) + ' ' + startOfProcess("self");
}

bool isAlive(const std::string& identity)
{
    std::istringstream words(identity);
    std::string system, process, start;
    return words >> system >> process >> start && system == startOfSystem() &&
           process.find_first_not_of("0123456789") == std::string::npos &&
           start == startOfProcess(process);
}

}  // namespace

std::string Run::verdict() const
{
    if (end)
        return end->verdict;
    return isGoingOn ? "running" : "";
}

RunTable::RunTable(Database& database)
    : begin_(database.prepare("INSERT INTO runs (volume, started, action) VALUES (?, ?, ?)")),
      open_(database.prepare("INSERT OR REPLACE INTO openRuns (run, owner) VALUES (?, ?)")),
      close_(database.prepare(
          "DELETE FROM openRuns WHERE run = ? OR run NOT IN (SELECT id FROM runs)")),
      end_(database.prepare(
          "UPDATE runs SET finished = ?, verdict = ?, error = ?, message = ?, "
          "tool = NULLIF(?, ''), problems = NULLIF(?, 0), problemKinds = NULLIF(?, 0), "
          "losses = NULLIF(?, 0) WHERE id = ?")),
      list_(database.prepare(
          "SELECT action, started, finished, verdict, error, message, owner, "
          "tool, problems, problemKinds, losses FROM runs "
          "LEFT JOIN openRuns ON run = id WHERE volume = ? ORDER BY id DESC LIMIT ?")),
      trim_(database.prepare("DELETE FROM runs WHERE volume = ?1 AND id <= (SELECT id FROM runs "
                             "WHERE volume = ?1 ORDER BY id DESC LIMIT 1 OFFSET ?2)")),
      database_(database)
{
}

bool RunTable::keepNewest(std::int64_t volume, std::int64_t count)
{
    trim_.bind(1, volume);
    trim_.bind(2, count);
    return trim_.run();
}

std::int64_t RunTable::begin(std::int64_t volume, std::string_view action, Run::Time started)
{
    begin_.bind(1, volume);
    begin_.bind(2, milliseconds(started));
    begin_.bind(3, action);
    Transaction transaction(database_);
    if (!transaction.hasBegun() || !keepNewest(volume, keptRuns - 1) || !begin_.run())
        return 0;
    const std::int64_t run = database_.lastInsertedRow();
    open_.bind(1, run);
    const std::string owner = ownIdentity();
    open_.bind(2, owner);
    return open_.run() && transaction.commit() ? run : 0;
}

bool RunTable::end(std::int64_t run, const RunEnd& end, Run::Time finished)
{
    end_.bind(1, milliseconds(finished));
    end_.bind(2, end.verdict);
    end_.bind(3, std::int64_t{end.errorCode});
    end_.bind(4, end.message);
    end_.bind(5, end.tool);
    end_.bind(6, end.problems);
    end_.bind(7, end.problemKinds);
    end_.bind(8, std::int64_t{end.hasLosses});
    end_.bind(9, run);
    close_.bind(1, run);
    Transaction transaction(database_);
    return transaction.hasBegun() && end_.run() && close_.run() && transaction.commit();
}

std::vector<Run> RunTable::runs(std::int64_t volume, std::int64_t limit)
{
    list_.bind(1, volume);
    list_.bind(2, limit);
    std::vector<Run> runs;
    while (list_.step() == Statement::Step::Row) {
        Run run{std::string(list_.text(0)), timeFrom(list_.integer(1)), {}, {}, false};
        if (!list_.isNothing(2)) {
            run.finished = timeFrom(list_.integer(2));
            run.end =
                RunEnd{std::string(list_.text(3)), static_cast<std::int32_t>(list_.integer(4)),
                       std::string(list_.text(5)), std::string(list_.text(7)),
                       list_.integer(8),           list_.integer(9),
                       list_.integer(10) != 0};
        }
        run.isGoingOn = !run.end && isAlive(std::string(list_.text(6)));
        runs.push_back(std::move(run));
    }
    std::reverse(runs.begin(), runs.end());
    return runs;
}

}  // namespace orvane
