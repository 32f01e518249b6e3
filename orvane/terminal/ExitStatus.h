// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string_view>

namespace orvane {

// The bits of the exit status, or-ed over all disks, after fsck(8).
inline constexpr int exitSound = 0;
inline constexpr int exitRepaired = 1;   ///< damage was found and repaired
inline constexpr int exitDamaged = 4;    ///< damage is left
inline constexpr int exitUnchecked = 8;  ///< could not be checked, or not conclusively
inline constexpr int exitUsage = 16;
inline constexpr int exitStopped = 32;

/// For a verdict of the disk-management library; an unknown one counts as unchecked.
int exitStatusFor(std::string_view verdict);

}  // namespace orvane
