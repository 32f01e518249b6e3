// SPDX-License-Identifier: Apache-2.0
#include "pellar/overlay/TrialDisk.h"

#include <cerrno>
#include <cstring>
#include <utility>

namespace pellar {
namespace {

Sentence cannotKeep(const OverlayRoom& room, int error)
{
    if (room.directory.empty())
        return {"there is no directory to keep what it would write", {}, {}};
    return {"what it would write cannot be kept in %1$@: %2$@", room.directory.native(),
            ::strerrordesc_np(error)};
}

Sentence cannotPresent(int error)
{
    if (error == ENOENT || error == ENODEV || error == ENXIO)
        return {"this system has no FUSE (/dev/fuse)", {}, {}};
    return {"no file system of its own (FUSE) could be made for it: %1$@",
            ::strerrordesc_np(error),
            {}};
}

}  // namespace

Result<TrialDisk, Sentence> TrialDisk::of(int disk, ByteRange region, const OverlayRoom& room)
{
    auto overlay = Overlay::over(disk, region, room);
    if (!overlay)
        return cannotKeep(room, overlay.error());
    auto file = OverlayFile::present(**overlay);
    if (!file)
        return cannotPresent(file.error());
    return TrialDisk(*std::move(overlay), *std::move(file));
}

}  // namespace pellar
