// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace orvane::test {

/// Runs a system tool to its end with `input` as its standard input and no output; its exit
/// status, 127 when it is not installed, or -1 when it was killed.
int runTool(const std::vector<std::string>& arguments, std::string_view input = {});

}  // namespace orvane::test
