// SPDX-License-Identifier: Apache-2.0
#include "orvane/privileges/MountedSystem.h"

#include "contract/foundation/UTF8.h"
#include "pellar/mounts/MountTable.h"
#include "pellar/packages/InstalledSystem.h"

#include <sys/stat.h>

#include <algorithm>

namespace orvane {
namespace {

// A user who mounts a file system of their own in user space may name any device as its source.
// Only btrfs, which may be on several, has another device number than its source has.
bool isReallyOn(const pellar::Mount& place, dev_t device)
{
    struct stat status = {};
    return place.filesystem == "btrfs" ||
           (::stat(place.target.c_str(), &status) == 0 && status.st_dev == device);
}

bool isRootOfSystem(const pellar::Mount& place, dev_t device)
{
    return !place.isBind() && isReallyOn(place, device) &&
           pellar::installedSystemAt(place.target) != pellar::PackageDatabase::None;
}

}  // namespace

bool isWayOfRootsAlone(const std::filesystem::path& directory)
{
    for (auto way = directory.parent_path();; way = way.parent_path()) {
        struct stat status = {};
        const bool isSafe = ::lstat(way.c_str(), &status) == 0 && S_ISDIR(status.st_mode) &&
                            status.st_uid == 0 && (status.st_mode & (S_IWGRP | S_IWOTH)) == 0;
        if (!isSafe || way == way.parent_path())
            return isSafe;
    }
}

pellar::Result<std::string, pellar::Sentence> mountedSystemOn(const std::filesystem::path& device)
{
    struct stat status = {};
    if (::stat(device.c_str(), &status) != 0 || !S_ISBLK(status.st_mode))
        return pellar::Sentence{"it is no longer there", {}, {}};
    auto places = pellar::mountsOf(status.st_rdev, pellar::SystemPaths());
    std::erase_if(places,
                  [&](const auto& place) { return !isRootOfSystem(place, status.st_rdev); });
    if (places.empty())
        return pellar::Sentence{
            "it is not mounted as the root of a system whose packages are known here", {}, {}};
    std::stable_partition(places.begin(), places.end(),
                          [](const auto& place) { return place.target == "/"; });
    const auto safe = std::find_if(places.begin(), places.end(), [](const auto& place) {
        return isWayOfRootsAlone(place.target);
    });
    if (safe != places.end())
        return safe->target;
    return pellar::Sentence{"it is mounted at “%1$@”, to which others than root can change the way",
                            contract::printable(places.front().target),
                            {}};
}

}  // namespace orvane
