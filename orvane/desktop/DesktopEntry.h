// SPDX-License-Identifier: Apache-2.0
#pragma once

namespace orvane::desktop {

/// The name of the program's desktop file (without its ending) and of its icon, by which the
/// desktop knows the window (packaging/desktop).
inline constexpr const char* desktopEntry = "org.orvane.Orvane";

}  // namespace orvane::desktop
