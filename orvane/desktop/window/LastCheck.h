// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/disks/Disk.h"

#include <QDateTime>

#include <functional>
#include <optional>
#include <string>

namespace orvane::desktop {

/// One action on a disk.
struct Check {
    std::string verdict;  ///< one of the library's verdicts; empty when it was cut off
    std::string message;  ///< one sentence; may be empty
    QDateTime started;
};

/// What is kept of the last actions on a disk, or on the part of it that is worst off.
struct LastCheck {
    Check told;                  ///< that came to an answer, where one did
    std::optional<Check> later;  ///< after it, and without an answer
    std::string part = {};       ///< the name of the part; empty for the disk itself
    /// Parts have not been checked, though nothing bad is known.
    bool isPartial = false;
};

/// What the list knows of a disk beyond its facts. Main thread.
struct DiskStates {
    /// None when the disk was never checked.
    std::function<std::optional<LastCheck>(const Disk& disk)> lastCheck;
    /// What a job is doing to the disk at this moment ("verifying…"); empty when none is.
    std::function<std::string(const Disk& disk)> activity;
    /// What is out of the ordinary about it, in a few words; mostly empty.
    std::function<std::string(const Disk& disk)> note;
};

}  // namespace orvane::desktop
