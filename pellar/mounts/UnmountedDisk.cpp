// SPDX-License-Identifier: Apache-2.0
#include "pellar/mounts/UnmountedDisk.h"

#include "fixwell/host/foundation/UTF8.h"
#include "pellar/mounts/Holders.h"
#include "pellar/mounts/MountContext.h"

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

// No other program is run, and no table but the kernel's is asked.
MountContext makeContext(const MountPlace& place)
{
    MountContext context(mnt_new_context());
    if (context) {
        mnt_context_disable_helpers(context.get(), 1);
        mnt_context_set_optsmode(context.get(), MNT_OMODE_NOTAB);
        mnt_context_set_target(context.get(), place.target.c_str());
    }
    return context;
}

int unmount(const MountPlace& place)
{
    // A file manager or an indexer that has just looked is gone in a moment.
    constexpr int attempts = 4;
    int error = 0;
    for (int attempt = 0; attempt < attempts; ++attempt) {
        if (attempt > 0)
            std::this_thread::sleep_for(std::chrono::milliseconds(150));
        MountContext context = makeContext(place);
        error = context ? errorOf(context, mnt_context_umount(context.get())) : ENOMEM;
        if (error != EBUSY)
            break;
    }
    return error;
}

Sentence refusal(const MountPlace& place, int error, const SystemPaths& paths)
{
    const std::string target = fixwell::printable(place.target);
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

/// Where all of the file system is mounted; empty when only parts are.
std::string wholeTargetOf(const std::vector<MountPlace>& places)
{
    const auto whole = std::find_if(places.begin(), places.end(),
                                    [](const MountPlace& place) { return !place.isBind(); });
    return whole != places.end() ? whole->target : std::string();
}

/// Why it could not be unmounted, or mounted again as it is; nothing when it could.
Sentence objectionTo(const std::vector<MountPlace>& places)
{
    const bool isWhole = !wholeTargetOf(places).empty();
    for (const MountPlace& place : places)
        if (place.filesystem.starts_with("fuse") || !isWhole)
            return {"it is mounted at “%1$@” in a way that could not be put back (%2$@)",
                    fixwell::printable(place.target), fixwell::printable(place.filesystem)};
    for (const MountPlace& place : places)
        if (isCovered(place, places))
            return {"it is mounted at “%1$@”, and something else over it",
                    fixwell::printable(place.target),
                    {}};
    return {};
}

}  // namespace

std::variant<UnmountedDisk, Sentence> UnmountedDisk::take(std::vector<MountPlace> places,
                                                          const SystemPaths& paths)
{
    if (const Sentence objection = objectionTo(places); !objection.isEmpty())
        return objection;
    std::vector<MountCall> calls;
    for (const MountPlace& place : places)
        calls.push_back(mountCallFor(place, wholeTargetOf(places)));
    auto keeper = MountKeeper::start(calls);
    if (const int* const error = std::get_if<int>(&keeper))
        return Sentence{
            "nobody could be found to mount it again, should this program be killed: "
            "%1$@",
            ::strerrordesc_np(*error),
            {}};
    UnmountedDisk disk(std::get<MountKeeper>(std::move(keeper)));
    for (; !places.empty(); places.pop_back(), calls.pop_back()) {
        // The last one first: it may lie over or below the others.
        if (const int error = unmount(places.back()))
            return refusal(places.back(), error, paths);
        disk.unmounted_.insert(disk.unmounted_.begin(), std::move(calls.back()));
    }
    return disk;
}

std::vector<Sentence> UnmountedDisk::mountAgain()
{
    std::vector<Sentence> failures;
    for (const MountCall& call : std::exchange(unmounted_, {}))
        if (const int error = perform(call))
            failures.push_back({"It could not be mounted again at “%1$@”: %2$@.",
                                fixwell::printable(call.target), ::strerrordesc_np(error)});
    keeper_.reset();
    return failures;
}

}  // namespace pellar
