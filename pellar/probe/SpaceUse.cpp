// SPDX-License-Identifier: Apache-2.0
#include "pellar/probe/SpaceUse.h"

#include <sys/statvfs.h>

namespace pellar {
namespace {

/// A superblock's bytes, and the volume's numbers in blocks.
struct Blocks {
    std::uint64_t bytes = 0;  ///< of one
    std::uint64_t count = 0;
    std::uint64_t free = 0;
};

// Linux, Documentation/filesystems/ext4/super.rst. The numbers of a volume whose journal waits, or
// that is mounted, are those of the last time that it was put away.
std::optional<Blocks> readExt(int descriptor, std::uint64_t start)
{
    constexpr std::uint64_t needsRecovery = 0x4;
    constexpr std::uint64_t is64Bit = 0x80;
    const auto block = readDisk(descriptor, start + 1024, 1024);
    if (!block)
        return std::nullopt;
    const std::uint64_t incompatible = littleEndian(*block, 0x60, 4);
    const std::uint64_t shift = littleEndian(*block, 0x18, 4);
    if (littleEndian(*block, 0x38, 2) != 0xEF53 || (incompatible & needsRecovery) != 0 || shift > 6)
        return std::nullopt;
    Blocks blocks{std::uint64_t{1024} << shift, littleEndian(*block, 0x4, 4),
                  littleEndian(*block, 0xC, 4)};
    if ((incompatible & is64Bit) != 0) {
        blocks.count |= littleEndian(*block, 0x150, 4) << 32U;
        blocks.free |= littleEndian(*block, 0x158, 4) << 32U;
    }
    return blocks;
}

// Microsoft FAT Specification, sections 3.1 to 3.3 and 5: only FAT32 keeps a count.
std::optional<Blocks> readFAT32(int descriptor, std::uint64_t start)
{
    const auto boot = readDisk(descriptor, start, 512);
    if (!boot || littleEndian(*boot, 22, 2) != 0)  // the length of a FAT of the older kinds
        return std::nullopt;
    const std::uint64_t sector = littleEndian(*boot, 11, 2);
    const std::uint64_t perCluster = littleEndian(*boot, 13, 1);
    const std::uint64_t sectors = littleEndian(*boot, 32, 4);
    const std::uint64_t before =
        littleEndian(*boot, 14, 2) + littleEndian(*boot, 16, 1) * littleEndian(*boot, 36, 4);
    const auto info = readDisk(descriptor, start + littleEndian(*boot, 48, 2) * sector, 512);
    if (!info || perCluster == 0 || before > sectors || littleEndian(*info, 0, 4) != 0x41615252 ||
        littleEndian(*info, 484, 4) != 0x61417272)
        return std::nullopt;
    return Blocks{sector * perCluster, (sectors - before) / perCluster,
                  littleEndian(*info, 488, 4)};
}

// xfs-documentation, "Superblocks": all numbers are big-endian.
std::optional<Blocks> readXFS(int descriptor, std::uint64_t start)
{
    const auto block = readDisk(descriptor, start, 512);
    if (!block || !holdsText(*block, 0, "XFSB"))
        return std::nullopt;
    return Blocks{bigEndian(*block, 4, 4), bigEndian(*block, 8, 8), bigEndian(*block, 144, 8)};
}

// btrfs.readthedocs.io, "On-disk format", superblock: total_bytes and bytes_used.
std::optional<Blocks> readBtrfs(int descriptor, std::uint64_t start)
{
    const auto block = readDisk(descriptor, start + 0x10000, 0x80);
    if (!block || !holdsText(*block, 0x40, "_BHRfS_M"))
        return std::nullopt;
    const std::uint64_t total = littleEndian(*block, 0x70, 8);
    const std::uint64_t used = littleEndian(*block, 0x78, 8);
    if (used > total)
        return std::nullopt;
    return Blocks{1, total, total - used};
}

std::optional<Blocks> readBlocks(int descriptor, std::uint64_t start, std::string_view type)
{
    if (type == "ext2" || type == "ext3" || type == "ext4")
        return readExt(descriptor, start);
    if (type == "vfat")
        return readFAT32(descriptor, start);
    if (type == "xfs")
        return readXFS(descriptor, start);
    return type == "btrfs" ? readBtrfs(descriptor, start) : std::nullopt;
}

std::optional<SpaceUse> spaceUseOf(const Blocks& blocks)
{
    const std::uint64_t total = productOrGreatest(blocks.bytes, blocks.count);
    if (blocks.bytes == 0 || blocks.count == 0 || blocks.free > blocks.count ||
        total == ~std::uint64_t{0})
        return std::nullopt;
    return SpaceUse{total, total - blocks.free * blocks.bytes};
}

}  // namespace

// A volume of btrfs on several devices says what all of them hold together.
std::optional<SpaceUse> spaceUseOf(int descriptor, ByteRange volume, std::string_view type)
{
    const auto blocks = readBlocks(descriptor, volume.offset, type);
    const auto use = blocks ? spaceUseOf(*blocks) : std::nullopt;
    return use && use->total <= volume.length ? use : std::nullopt;
}

std::optional<SpaceUse> spaceUseOfMount(const char* mountPoint)
{
    struct statvfs status = {};
    if (::statvfs(mountPoint, &status) != 0)
        return std::nullopt;
    return spaceUseOf({status.f_frsize, status.f_blocks, status.f_bfree});
}

}  // namespace pellar
