// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/F2fsSuperblock.h"

namespace pellar {

std::optional<F2fsSuperblock> parseF2fsSuperblock(Bytes bytes)
{
    constexpr std::uint64_t magicNumber = 0xF2F52010;
    if (bytes.size() < F2fsSuperblock::size || littleEndian(bytes, 0, 4) != magicNumber)
        return std::nullopt;
    const std::uint64_t blockShift = littleEndian(bytes, 16, 4);
    const std::uint64_t blocks = littleEndian(bytes, 36, 8);
    if (blockShift < 12 || blockShift > 16 || blocks == 0)
        return std::nullopt;
    F2fsSuperblock block;
    block.volumeBytes = productOrGreatest(blocks, std::uint64_t{1} << blockShift);
    return block;
}

std::optional<F2fsSuperblock> readF2fsSuperblock(int descriptor, std::uint64_t offset,
                                                 std::uint64_t availableBytes)
{
    constexpr std::uint64_t primaryPlace = 1024;
    for (const std::uint64_t place : {primaryPlace, primaryPlace + 4096}) {
        if (availableBytes < place + F2fsSuperblock::size)
            break;
        const auto bytes = readDisk(descriptor, offset + place, F2fsSuperblock::size);
        auto block = bytes ? parseF2fsSuperblock(*bytes) : std::nullopt;
        if (block) {
            block->isBackup = place != primaryPlace;
            return block;
        }
    }
    return std::nullopt;
}

}  // namespace pellar
