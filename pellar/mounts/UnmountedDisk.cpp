// SPDX-License-Identifier: Apache-2.0
#include "pellar/mounts/UnmountedDisk.h"

#include "contract/foundation/UTF8.h"
#include "pellar/mounts/Holders.h"

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstring>
#include <filesystem>
#include <memory>
#include <thread>
#include <utility>

namespace pellar {
namespace {

int unmountPatiently(const MountCalls& calls, std::size_t index)
{
    // A file manager or an indexer that has just looked is gone in a moment.
    constexpr int attempts = 4;
    int error = 0;
    for (int attempt = 0; attempt < attempts; ++attempt) {
        if (attempt > 0)
            std::this_thread::sleep_for(std::chrono::milliseconds(150));
        error = unmount(calls.points, index);
        if (error != EBUSY)
            break;
    }
    return error;
}

Sentence refusal(const MountPlace& place, int error, const SystemPaths& paths)
{
    const std::string target = contract::printable(place.target);
    if (error == EPERM || error == EACCES)
        return {"it is mounted at “%1$@”, and only an administrator may unmount it", target, {}};
    if (error != EBUSY)
        return {"it cannot be unmounted from “%1$@”: %2$@", target, ::strerrordesc_np(error)};
    if (const auto below = mountsBelow(place.target, paths); !below.empty())
        return {"it is mounted at “%1$@”, and something else below, at %2$@", target,
                shownNames(below)};
    if (const auto holders = holdersOf(place.target); !holders.empty())
        return {"it is mounted at “%1$@” and in use by %2$@", target, shownNames(holders)};
    return {"it is mounted at “%1$@” and in use", target, {}};
}

/// Why it could not be unmounted, or mounted again as it is; nothing when it could.
Sentence objectionTo(const std::vector<MountPlace>& places)
{
    const bool isWhole = !std::all_of(places.begin(), places.end(),
                                      [](const MountPlace& place) { return place.isBind(); });
    for (const MountPlace& place : places)
        if (place.filesystem.starts_with("fuse") || !isWhole)
            return {"it is mounted at “%1$@” in a way that could not be put back (%2$@)",
                    contract::printable(place.target), contract::printable(place.filesystem)};
    return {};
}

Sentence whyNotHeld(const MountPlace& place, int error, const SystemPaths& paths)
{
    const std::string target = contract::printable(place.target);
    if (error == EBUSY)
        return {"it is mounted at “%1$@”, and something else over it", target, {}};
    if (error == EPERM || error == EACCES)
        return refusal(place, error, paths);
    return {"it is mounted at “%1$@” in a way that could not be put back (%2$@)", target,
            ::strerrordesc_np(error)};
}

Sentence whyNotMountedAgain(const MountCall& call, int error)
{
    const std::string target = contract::printable(call.target);
    if (error == ESTALE)
        return {"It stays unmounted: “%1$@” is no longer the directory at which it was mounted.",
                target,
                {}};
    return {"It could not be mounted again at “%1$@”: %2$@.", target, ::strerrordesc_np(error)};
}

}  // namespace

std::variant<UnmountedDisk, Sentence> UnmountedDisk::take(std::vector<MountPlace> places,
                                                          const SystemPaths& paths)
{
    if (const Sentence objection = objectionTo(places); !objection.isEmpty())
        return objection;
    auto calls = mountCallsFor(places);
    if (const auto* const notHeld = std::get_if<NotHeld>(&calls))
        return whyNotHeld(places[notHeld->place], notHeld->error, paths);
    auto keeper = MountKeeper::start(std::get<MountCalls>(calls));
    if (const int* const error = std::get_if<int>(&keeper))
        return Sentence{
            "nobody could be found to mount it again, should this program be killed: "
            "%1$@",
            ::strerrordesc_np(*error),
            {}};
    UnmountedDisk disk(std::get<MountCalls>(std::move(calls)),
                       std::get<MountKeeper>(std::move(keeper)));
    // The last one first: it may lie over or below the others.
    for (; disk.mounted_ > 0; --disk.mounted_) {
        const std::size_t last = disk.mounted_ - 1;
        if (const int error = unmountPatiently(disk.calls_, last))
            return refusal(places[last], error, paths);
        if (disk.calls_.points[last].holder)
            disk.uncovered_.push_back(openShown(disk.calls_.points, last));
    }
    return disk;
}

std::vector<Sentence> UnmountedDisk::mountAgain()
{
    std::vector<Sentence> failures;
    for (; mounted_ < calls_.calls.size(); ++mounted_)
        if (const int error = perform(calls_, mounted_))
            failures.push_back(whyNotMountedAgain(calls_.calls[mounted_], error));
    uncovered_.clear();
    keeper_.reset();
    return failures;
}

}  // namespace pellar
