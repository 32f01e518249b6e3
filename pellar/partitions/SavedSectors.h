// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Result.h"
#include "pellar/partitions/RepairPlan.h"
#include "pellar/texts/Sentence.h"

#include <chrono>
#include <filesystem>

namespace pellar {

/// What the sectors are kept with.
struct SavedDisk {
    std::filesystem::path path;
    std::uint64_t offset = 0;  ///< bytes, of the disk within the file
    std::uint32_t sectorBytes = 512;
    std::chrono::system_clock::time_point now;
};

/// Keeps what a plan will overwrite, so that a person can put it back: a new directory of the
/// user's alone below `directory`, with one file for each stretch of sectors and a README.txt that
/// tells the disk, the date, the places and the commands. Answers it when all of that has reached
/// the medium, else why not.
[[nodiscard]] Result<std::filesystem::path, Sentence> saveSectors(
    const RepairPlan& plan, const SavedDisk& disk, const std::filesystem::path& directory);

/// The text of the README. Pure.
[[nodiscard]] std::string instructionsFor(const RepairPlan& plan, const SavedDisk& disk,
                                          const std::filesystem::path& saved);

}  // namespace pellar
