// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

namespace orvane::bench {

/// How long the program takes, in seconds of the wall clock; its output is thrown away. Throws
/// when it cannot be run.
double secondsOf(const std::vector<std::string>& arguments);

}  // namespace orvane::bench
