// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/DiskNames.h"

namespace orvane {
namespace {

// The number of what fills an image, without a partition map.
constexpr std::string_view wholeImage = "#0";

}  // namespace

std::string DiskNames::nameOf(std::string_view identifier) const
{
    for (const auto& [known, name] : names_) {
        if (!isWithin(identifier, known))
            continue;
        const std::string_view part = identifier.substr(known.size());
        return part == wholeImage ? name : name + std::string(part);
    }
    return std::string(identifier);
}

bool DiskNames::isWithin(std::string_view identifier, std::string_view named)
{
    if (!identifier.starts_with(named))
        return false;
    const std::string_view part = identifier.substr(named.size());
    return part.empty() || (part.front() == '#' && part.size() > 1 &&
                            part.find_first_not_of("0123456789", 1) == std::string_view::npos);
}

}  // namespace orvane
