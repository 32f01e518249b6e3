// SPDX-License-Identifier: Apache-2.0
#include "fixwell/messagelog/ColorMarkers.h"

#include "contract/pellar/ResultPhrases.h"

namespace fixwell {

bool scanForSpecialChars(std::string_view line)
{
    return line.find(errorMarker) != std::string_view::npos;
}

std::string_view removeSpecialChars(std::string_view line)
{
    const std::size_t marker = line.find(errorMarker);
    std::size_t end = line.find("[0m");
    if (end == std::string_view::npos)
        end = line.find("[30m");
    if (marker == std::string_view::npos || end == std::string_view::npos)
        return line;
    const std::size_t start = marker + errorMarker.size();
    return end < start ? line : line.substr(start, end - start);
}

}  // namespace fixwell
