// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/udisks/MountedAt.h"

#include "fixwell/host/foundation/UTF8.h"
#include "pellar/mounts/Holders.h"

#include <sys/stat.h>

namespace orvane {

std::vector<pellar::MountPlace> placesOf(const std::string& node)
{
    struct stat status = {};
    if (::stat(node.c_str(), &status) != 0 || !S_ISBLK(status.st_mode))
        return {};
    return pellar::mountPlacesOf(status.st_rdev, pellar::SystemPaths());
}

std::string holdersText(const std::vector<pellar::MountPlace>& places)
{
    constexpr std::size_t most = 4;
    std::vector<std::string> holders;
    for (const pellar::MountPlace& place : places)
        for (const std::string& holder : pellar::holdersOf(place.target))
            holders.push_back(fixwell::printable(holder));
    std::string text;
    for (std::size_t i = 0; i < holders.size() && i < most; ++i)
        text += (text.empty() ? "" : ", ") + holders[i];
    return holders.size() > most ? text + ", …" : text;
}

}  // namespace orvane
