// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/disks/Disk.h"

#include <QDateTime>

#include <functional>
#include <optional>
#include <string>

namespace orvane::desktop {

/// What is kept of the last action on a disk.
struct LastCheck {
    std::string verdict;  ///< one of the library's verdicts; empty when it was cut off
    std::string message;  ///< one sentence; may be empty
    QDateTime started;
};

/// None when the disk was never checked. Main thread.
using LastCheckLookup = std::function<std::optional<LastCheck>(const Disk& disk)>;

}  // namespace orvane::desktop
