// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/jobs/JobObserver.h"
#include "orvane/support/history/RunTable.h"

#include <string>

namespace orvane::desktop {

/// One tool's run on one disk, as the user would name it.
struct StartedRun {
    Operation operation = Operation::VerifyDisk;
    std::string disk;             ///< any bytes
    std::string identifier = {};  ///< the disk's

    friend bool operator==(const StartedRun&, const StartedRun&) = default;
};

struct FinishedRun {
    StartedRun run;
    RunEnd end;
};

/// YES for what changes the disk.
constexpr bool writes(Operation operation)
{
    return operation == Operation::RepairDisk || operation == Operation::RepairPermissions ||
           operation == Operation::RepairPartitionMap;
}

}  // namespace orvane::desktop
