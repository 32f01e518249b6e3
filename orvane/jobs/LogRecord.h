// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Dictionary.h"
#include "contract/foundation/Name.h"

#include <cstdint>
#include <optional>
#include <string>

namespace orvane {

/// The finished text of a record with its looks, as modules draw, copy and print it.
inline const contract::Name finalTextKey{"kOV_finalAttributedString_type"};

/// A row of a disk's log, in the form in which the modules keep and draw it (fixwell/messagelog):
/// the library's message keys and the finished text, one line.
[[nodiscard]] contract::Dictionary logRecord(std::optional<contract::Name> type,
                                             const std::string& text, std::int64_t verbosity);

/// The record, marked as a line within a run: no run begins with it.
[[nodiscard]] contract::Dictionary lineOfRun(contract::Dictionary record);

/// The same of a message of the library, at the level at which a module shows it.
[[nodiscard]] contract::Dictionary logRecordOf(const contract::Dictionary& message);

}  // namespace orvane
