// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Dictionary.h"
#include "contract/pellar/MessageKeys.h"

namespace orvane {

/// Where a record of the log came from, as modules keep it; the records that begin a run have none.
inline const contract::Name typeOfOutputKey{"kOV_typeOfOutputKey"};

/// A run begins with the record: a heading that came neither from the library nor from what a
/// module adds later. The host's own runs begin so as well. Costs next to nothing for other
/// records.
[[nodiscard]] inline bool isStartOfRun(const contract::Dictionary& record)
{
    return record.integer(contract::kFsckVerbosity) == contract::verbosity::heading &&
           !record.has(typeOfOutputKey) &&
           record.string(contract::kFsckMessageType) != contract::kFsckError.text();
}

}  // namespace orvane
