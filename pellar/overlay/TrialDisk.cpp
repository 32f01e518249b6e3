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

Result<TrialDisk, Sentence> TrialDisk::of(int disk, ByteRange region, const OverlayRoom& room,
                                          const std::function<bool()>& isStopped)
{
    auto overlay = Overlay::over(disk, region, room);
    if (!overlay)
        return cannotKeep(room, overlay.error());
    auto file = OverlayFile::present(**overlay);
    if (file)
        return TrialDisk(*std::move(overlay), *std::move(file));
    auto copy = FullCopy::of(disk, region, room, isStopped);
    if (copy)
        return TrialDisk(*std::move(copy));
    if (copy.error() == ENOSPC)
        return Sentence{
            "this system cannot show a disk through FUSE, and there is no room for a "
            "copy of the image in %1$@",
            room.directory.native(),
            {}};
    return cannotPresent(file.error());
}

}  // namespace pellar
