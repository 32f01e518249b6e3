// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/OVPreferences.h"

#include <cstdint>
#include <filesystem>

namespace orvane {

/// The greatest number of each: no limit.
inline constexpr std::uint64_t unlimitedRepairs = 1'000'000;
/// A century: more days would not fit into the clock's nanoseconds.
inline constexpr std::uint64_t mostRepairDays = 36'500;

/// What of the stored settings (SettingsFile) is about repairs. The keys are the fields' names.
struct RepairSettings {
    std::uint64_t keptRepairs = 20;            ///< of all disks together, that can be undone
    std::uint64_t keptRepairDays = 90;         ///< at most `mostRepairDays`
    std::uint64_t keptRepairMegabytes = 4096;  ///< of 2^20 bytes, all repairs together
    /// A verification that finds nothing tries a repair as well.
    bool thoroughVerification = false;

    friend bool operator==(const RepairSettings&, const RepairSettings&) = default;
};

/// Reads the file and leaves it as it is. What is missing in it, or is no number from 0 to a
/// million, is as above; more days than `mostRepairDays` are that many.
[[nodiscard]] RepairSettings readRepairSettings(const std::filesystem::path& file);

/// The same of settings that have been read.
[[nodiscard]] RepairSettings repairSettingsIn(const contract::UserDefaults& settings);

}  // namespace orvane
