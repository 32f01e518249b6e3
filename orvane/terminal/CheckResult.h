// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/disks/DiskFacts.h"
#include "orvane/support/history/RunTable.h"
#include "orvane/support/systemd/Journal.h"

#include <string>
#include <vector>

namespace orvane {

/// What a scheduled check came to for one volume.
struct CheckResult {
    std::string name;  ///< of the disk, as the user or the system calls it; any bytes
    DiskFacts facts;
    Run run;              ///< where it was checked
    std::string skipped;  ///< why it was not; empty where it was
};

/// The records have these identifiers (journalctl(1), MESSAGE_ID=).
inline constexpr const char* checkedMessage = "5d0d2ac1c4de4b7f9f4c8b1f6a0e73d2";
inline constexpr const char* skippedMessage = "b6f0a8d6f1a34c4c8d5e21f77b9c4a90";

/// As a record of the journal; `sentence` is for people.
[[nodiscard]] std::vector<JournalField> journalFieldsOf(const CheckResult& result,
                                                        const std::string& sentence);

}  // namespace orvane
