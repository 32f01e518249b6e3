// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/disks/UdevDatabase.h"

#include "orvane/support/files/WholeFile.h"

#include <charconv>
#include <sstream>

namespace orvane {

std::map<std::string, std::string> udevProperties(const std::string& number,
                                                  const std::filesystem::path& database)
{
    std::map<std::string, std::string> properties;
    const auto contents = readWholeFile(database / ("b" + number), 1U << 20U);
    std::istringstream lines(contents ? *contents : std::string());
    for (std::string line; std::getline(lines, line);) {
        const std::size_t equals = line.find('=');
        if (line.starts_with("E:") && equals != std::string::npos)
            properties.emplace(line.substr(2, equals - 2), line.substr(equals + 1));
    }
    return properties;
}

std::string decodeUdevName(std::string_view encoded)
{
    std::string name;
    while (!encoded.empty()) {
        unsigned byte = 0;
        const bool isEscape =
            encoded.size() >= 4 && encoded.starts_with("\\x") &&
            std::from_chars(encoded.data() + 2, encoded.data() + 4, byte, 16).ptr ==
                encoded.data() + 4;
        name += isEscape ? static_cast<char>(byte) : encoded.front();
        encoded.remove_prefix(isEscape ? 4 : 1);
    }
    return name;
}

}  // namespace orvane
