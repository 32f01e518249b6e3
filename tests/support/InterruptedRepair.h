// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <filesystem>
#include <string>

namespace orvane::test {

/// Leaves the image as a repair does that was cut off after half of it was written: 'r' in one of
/// two places. Its record is in `records`. What the repaired image would hold; throws what keeps
/// the test from being prepared.
std::string interruptRepair(const std::filesystem::path& image,
                            const std::filesystem::path& records);

}  // namespace orvane::test
