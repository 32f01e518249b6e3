// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/disks/DiskFacts.h"

#include <QIcon>

#include <string_view>

namespace orvane::desktop {

/// By the kind of disk.
[[nodiscard]] QIcon diskIcon(const DiskFacts& facts);

/// A mark for one of the library's verdicts; the text beside it says the same.
[[nodiscard]] QIcon verdictIcon(std::string_view verdict);

}  // namespace orvane::desktop
