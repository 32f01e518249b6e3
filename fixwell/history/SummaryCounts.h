// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Array.h"
#include "contract/foundation/Dictionary.h"
#include "fixwell/Contract.h"

namespace fixwell {

/// The record that closes a run: how many messages of each type came since the newest heading,
/// under the types' names. The walk goes backwards and ends at the first record of negative
/// verbosity, so a reported "ERROR" hides itself and everything before it from the counts.
Dictionary makeSummaryRecord(const Array& history);

}  // namespace fixwell
