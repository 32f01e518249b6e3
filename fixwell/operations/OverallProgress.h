// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/Contract.h"

#include <cstdint>

namespace fixwell {

/// The share of the newer permissions tool's reports that is work: they run from 20 to 100,
/// because it counts the reading of its database as the first 20.
constexpr double kestronPercent(double percent)
{
    return (percent - 20) * 100 / 80;
}

/// How far a job of `total` actions is when action number `current` (from 1) stands at `percent`.
/// Rounded to single precision, as the bar takes it.
constexpr double overallPercent(std::int64_t current, std::int64_t total, double percent)
{
    const auto actions = static_cast<double>(total);
    const double before = static_cast<double>(current - 1) / actions * 100;
    return static_cast<float>(before + percent * (1 / actions));
}

}  // namespace fixwell
