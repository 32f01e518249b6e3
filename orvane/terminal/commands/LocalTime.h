// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <chrono>
#include <string>

namespace orvane {

/// "2024-05-06 07:08", the local time.
std::string localTime(std::chrono::system_clock::time_point time);

}  // namespace orvane
