// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/btrfs/BtrfsSuperblock.h"

#include <algorithm>

namespace pellar {
namespace {

/// None for a superblock that says itself that it belongs elsewhere than at `place`.
std::optional<BtrfsSuperblock> parseBtrfsSuperblock(ByteView bytes, std::uint64_t place)
{
    if (bytes.size() < BtrfsSuperblock::size || !holdsText(bytes, 64, "_BHRfS_M") ||
        littleEndian(bytes, 48, 8) != place)
        return std::nullopt;
    BtrfsSuperblock block;
    std::copy_n(bytes.begin() + 32, block.id.size(), block.id.begin());
    block.log = littleEndian(bytes, 96, 8);
    block.disks = littleEndian(bytes, 136, 8);
    block.diskBytes = littleEndian(bytes, 209, 8);
    return block.disks == 0 ? std::nullopt : std::optional(block);
}

}  // namespace

std::optional<BtrfsSuperblock> readBtrfsSuperblock(int descriptor, std::uint64_t offset,
                                                   std::uint64_t availableBytes)
{
    constexpr std::uint64_t primaryPlace = std::uint64_t{64} << 10U;
    for (const std::uint64_t place :
         {primaryPlace, std::uint64_t{64} << 20U, std::uint64_t{256} << 30U}) {
        if (availableBytes < place + BtrfsSuperblock::size)
            break;
        const auto bytes = readDisk(descriptor, offset + place, BtrfsSuperblock::size);
        auto block = bytes ? parseBtrfsSuperblock(*bytes, place) : std::nullopt;
        if (block) {
            block->isBackup = place != primaryPlace;
            return block;
        }
    }
    return std::nullopt;
}

}  // namespace pellar
