// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <chrono>
#include <optional>
#include <string>
#include <string_view>

namespace orvane {

/// How far a job is, as the bottom line of a terminal shows it.
struct JobProgress {
    std::optional<double> percent;  ///< none while there is no telling
    std::string status;
    std::chrono::seconds elapsed{0};
};

/// One line of at most `columns` columns: a bar and the percentage, or a moving mark and the time
/// gone by, and the status text.
std::string progressLine(const JobProgress& progress, std::size_t columns);

}  // namespace orvane
