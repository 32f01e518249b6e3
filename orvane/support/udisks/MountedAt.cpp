// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/udisks/MountedAt.h"

#include "pellar/mounts/Holders.h"

namespace orvane {

std::vector<pellar::Mount> placesOf(const std::string& node)
{
    return pellar::mountsOf(std::filesystem::path(node), pellar::SystemPaths());
}

std::string holdersText(const std::vector<pellar::Mount>& places)
{
    std::vector<std::string> holders;
    for (const pellar::Mount& place : places)
        for (const std::string& holder : pellar::holdersOf(place.target))
            holders.push_back(holder);
    return pellar::shownNames(holders);
}

}  // namespace orvane
