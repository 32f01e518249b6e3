// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <filesystem>
#include <string>
#include <string_view>
#include <vector>

namespace orvane::bench {

/// The file as lines, each with its line feed; the views are of `text`.
std::vector<std::string_view> linesOf(const std::string& text);

std::string readFile(const std::filesystem::path& file);

}  // namespace orvane::bench
