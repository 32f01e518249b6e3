// SPDX-License-Identifier: Apache-2.0
#include "orvane/jobs/LastRuns.h"

#include "contract/pellar/MessageKeys.h"

#include <algorithm>
#include <utility>

namespace orvane {
namespace {

bool hasAnswer(const Run& run)
{
    if (!run.end)
        return false;
    const std::string& verdict = run.end->verdict;
    return verdict == contract::kPLVerdictSound.text() ||
           verdict == contract::kPLVerdictDamaged.text() ||
           verdict == contract::kPLVerdictRepaired.text();
}

}  // namespace

std::optional<LastRuns> lastRunsOf(HistoryStore& store, std::string_view key)
{
    auto last = store.lastRun(key);
    if (!last || hasAnswer(*last))
        return last ? std::optional(LastRuns{*std::move(last), std::nullopt}) : std::nullopt;
    const auto runs = store.runs(key);
    const auto told = std::find_if(runs.rbegin(), runs.rend(), hasAnswer);
    if (told == runs.rend())
        return LastRuns{*std::move(last), std::nullopt};
    return LastRuns{*told, std::move(last)};
}

}  // namespace orvane
