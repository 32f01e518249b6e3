// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/Contract.h"

#include <cstdint>
#include <string_view>

namespace fixwell {

/// Why an action is not available for the selection.
enum FXWReason : std::int32_t {
    FXWReasonNone = 0,
    FXWReasonIgnoresOwnership = 1,
    FXWReasonNotStartupDisk = 2,
    FXWReasonStartupDiskSelected = 3,
    FXWReasonHomeDirectory = 4,
    FXWReasonLiveCheckUnavailable = 5,
    FXWReasonCannotRepair = 6,
    FXWReasonCannotVerify = 7,
    FXWReasonNotMounted = 8,
    FXWReasonNotWritable = 9,
};

/// The English sentence, which is also the key in the string table; empty for no reason and for
/// an unknown one. `isMultiple`: the selection holds more than one disk.
std::string_view reasonText(std::int32_t reason, bool isMultiple);

}  // namespace fixwell
