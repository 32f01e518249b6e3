// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Array.h"
#include "contract/foundation/Dictionary.h"
#include "contract/support/OVWindowController.h"
#include "fixwell/Contract.h"

#include <optional>
#include <string>

namespace fixwell {

/// The report on a job that completed these entries. Only the first is reported, and "success"
/// says that there was one, not that its disk was sound.
Dictionary makeCompletionReport(const Array& completedList);

/// What the one alert at the end of a job says.
struct PostedWarning {
    std::string title;
    std::string message;

    friend bool operator==(const PostedWarning&, const PostedWarning&) = default;
};

/// The warning of the first completed entry that has one. Permission runs never warn. An entry
/// that carries an empty warning, where none carries a real one, gives an empty alert.
std::optional<PostedWarning> warningToPost(const Array& completedList);

/// The record that closes a run: how many messages of each type came since the newest heading,
/// under the types' names. The walk goes backwards and ends at the first record of negative
/// verbosity, so a reported "ERROR" hides itself and everything before it from the counts.
Dictionary makeSummaryRecord(const Array& history);

}  // namespace fixwell
