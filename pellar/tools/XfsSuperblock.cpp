// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/XfsSuperblock.h"

namespace pellar {
namespace {

/// Where a second group may begin: a disk is divided into four (small ones into two), and no group
/// is greater than 1 TiB.
std::vector<std::uint64_t> backupPlaces(std::uint64_t availableBytes)
{
    constexpr std::uint64_t greatestGroup = 1ULL << 40U;
    std::vector<std::uint64_t> places{greatestGroup};
    for (const std::uint64_t blockBytes : {4096U, 1024U, 2048U, 65536U, 512U})
        for (const std::uint64_t groups : {4U, 2U, 16U, 32U}) {
            const std::uint64_t blocks = availableBytes / blockBytes;
            places.push_back((blocks + groups - 1) / groups * blockBytes);
        }
    return places;
}

}  // namespace

std::optional<XfsSuperblock> parseXfsSuperblock(Bytes bytes)
{
    if (bytes.size() < XfsSuperblock::size || !holdsText(bytes, 0, "XFSB"))
        return std::nullopt;
    const std::uint64_t blockBytes = bigEndian(bytes, 4, 4);
    const std::uint64_t blocks = bigEndian(bytes, 8, 8);
    const std::uint64_t groupBlocks = bigEndian(bytes, 84, 4);
    if (!isPowerOfTwo(blockBytes) || blockBytes < 512 || blockBytes > 65536 || blocks == 0 ||
        groupBlocks == 0)
        return std::nullopt;
    XfsSuperblock block;
    block.volumeBytes = productOrGreatest(blocks, blockBytes);
    block.groupBytes = groupBlocks * blockBytes;
    block.hasRealtimePart = bigEndian(bytes, 16, 8) != 0;
    block.hasExternalLog = bigEndian(bytes, 48, 8) == 0;
    return block;
}

std::optional<XfsSuperblock> readXfsSuperblock(int descriptor, std::uint64_t offset,
                                               std::uint64_t availableBytes)
{
    if (availableBytes < XfsSuperblock::size)
        return std::nullopt;
    if (const auto bytes = readDisk(descriptor, offset, XfsSuperblock::size))
        if (const auto primary = parseXfsSuperblock(*bytes))
            return primary;
    for (const std::uint64_t place : backupPlaces(availableBytes)) {
        if (place == 0 || place >= availableBytes)
            continue;
        const auto bytes = readDisk(descriptor, offset + place, XfsSuperblock::size);
        auto backup = bytes ? parseXfsSuperblock(*bytes) : std::nullopt;
        if (backup && backup->groupBytes == place) {
            backup->isBackup = true;
            return backup;
        }
    }
    return std::nullopt;
}

}  // namespace pellar
