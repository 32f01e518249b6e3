// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/files/Failure.h"

#include <string>
#include <vector>

namespace orvane {

struct DesktopNotice {
    std::string title;               ///< plain text
    std::vector<std::string> lines;  ///< plain text
};

/// Hands it to the notification server of this user's session (Desktop Notifications Specification
/// 1.2), where it stays until it is dismissed. Why not, where there is none, or it has not answered
/// after five seconds.
[[nodiscard]] Result<void, Failure> showOnDesktop(const DesktopNotice& notice);

}  // namespace orvane
