// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/history/HistoryStore.h"

#include <optional>
#include <string_view>

namespace orvane {

/// What is known of a disk by its runs: a run that was stopped, or failed, says nothing about the
/// disk, and does not take the place of the last one that did.
struct LastRuns {
    /// The last run that came to an answer; where none did, the last one.
    Run told;
    /// The last run, where it came to none and `told` did.
    std::optional<Run> later;
};

/// None when there was no run. Main thread.
[[nodiscard]] std::optional<LastRuns> lastRunsOf(HistoryStore& store, std::string_view key);

}  // namespace orvane
