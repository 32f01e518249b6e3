// SPDX-License-Identifier: Apache-2.0
#include "bench/RealOutput.h"

#include <algorithm>
#include <fstream>
#include <sstream>

namespace orvane::bench {

std::vector<std::string_view> linesOf(const std::string& text)
{
    std::vector<std::string_view> lines;
    for (std::string_view rest = text; !rest.empty();) {
        const std::size_t length = std::min(rest.find('\n'), rest.size() - 1) + 1;
        lines.push_back(rest.substr(0, length));
        rest.remove_prefix(length);
    }
    return lines;
}

std::string readFile(const std::filesystem::path& file)
{
    std::ifstream stream(file, std::ios::binary);
    std::ostringstream text;
    text << stream.rdbuf();
    return text.str();
}

}  // namespace orvane::bench
