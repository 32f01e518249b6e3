// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/ext/ExtSuperblock.h"

#include "pellar/bytes/Checksums.h"

#include <algorithm>
#include <array>

namespace pellar {
namespace {

constexpr std::uint16_t magicNumber = 0xEF53;
constexpr std::uint32_t firstRevisionWithInodeSize = 1;
constexpr std::uint32_t incompatRecover = 0x4;
constexpr std::uint32_t incompatJournalDevice = 0x8;
constexpr std::uint32_t incompat64Bit = 0x80;
constexpr std::uint32_t incompatMetaGroups = 0x10;
constexpr std::uint32_t compatFewBackups = 0x200;
constexpr std::uint32_t readOnlyCompatSparseBackups = 0x1;
constexpr std::uint32_t readOnlyCompatMetadataChecksum = 0x400;

std::uint32_t number(ByteView bytes, std::size_t offset, std::size_t length)
{
    return static_cast<std::uint32_t>(littleEndian(bytes, offset, length));
}

bool hasRightChecksum(ByteView bytes)
{
    constexpr std::size_t checksumOffset = 0x3FC;
    const std::uint32_t readOnlyCompat = number(bytes, 0x64, 4);
    return (readOnlyCompat & readOnlyCompatMetadataChecksum) == 0 ||
           crc32c(bytes.first(checksumOffset)) == number(bytes, checksumOffset, 4);
}

/// Where the first backup lies: block 8193 with blocks of 1 KiB, 16384 of 2 KiB, 32768 of 4 KiB.
struct BackupPlace {
    std::uint64_t offset;
    std::uint32_t blockBytes;
};
constexpr std::array backupPlaces{BackupPlace{32768ULL * 4096, 4096},
                                  BackupPlace{8193ULL * 1024, 1024},
                                  BackupPlace{16384ULL * 2048, 2048}};

/// None when the bytes are no superblock: no magic number, impossible geometry, or a checksum
/// that does not fit.
std::optional<ExtSuperblock> parseExtSuperblock(ByteView bytes)
{
    constexpr std::uint32_t greatestBlockShift = 6;  // blocks of 64 KiB
    if (bytes.size() < ExtSuperblock::size || number(bytes, 0x38, 2) != magicNumber)
        return std::nullopt;
    const std::uint32_t blockShift = number(bytes, 0x18, 4);
    const std::uint32_t compat = number(bytes, 0x5C, 4);
    const std::uint32_t incompat = number(bytes, 0x60, 4);
    ExtSuperblock block;
    block.blockCount = number(bytes, 0x04, 4);
    if ((incompat & incompat64Bit) != 0)
        block.blockCount |= std::uint64_t{number(bytes, 0x150, 4)} << 32U;
    if (blockShift > greatestBlockShift || block.blockCount == 0 || !hasRightChecksum(bytes))
        return std::nullopt;
    block.blockBytes = 1024U << blockShift;
    block.inodeCount = number(bytes, 0x00, 4);
    block.freeInodes = number(bytes, 0x10, 4);
    block.firstDataBlock = number(bytes, 0x14, 4);
    block.groupBlocks = number(bytes, 0x20, 4);
    block.groupInodes = number(bytes, 0x28, 4);
    if (number(bytes, 0x4C, 4) >= firstRevisionWithInodeSize)
        block.inodeBytes = number(bytes, 0x58, 2);
    block.descriptorBytes = (incompat & incompat64Bit) != 0 ? number(bytes, 0xFE, 2) : 32;
    block.hasMetaGroups = (incompat & incompatMetaGroups) != 0;
    block.hasFewBackups = (compat & compatFewBackups) != 0;
    block.hasSparseBackups = (number(bytes, 0x64, 4) & readOnlyCompatSparseBackups) != 0;
    block.isJournalDevice = (incompat & incompatJournalDevice) != 0;
    block.needsRecovery = (incompat & incompatRecover) != 0;
    return block;
}

std::optional<ExtSuperblock> readAt(int descriptor, std::uint64_t place)
{
    const auto bytes = readDisk(descriptor, place, ExtSuperblock::size);
    return bytes ? parseExtSuperblock(*bytes) : std::nullopt;
}

}  // namespace

std::uint64_t ExtSuperblock::volumeBytes() const
{
    return productOrGreatest(blockCount, blockBytes);
}

std::uint64_t ExtSuperblock::groups() const
{
    return groupBlocks == 0 || firstDataBlock >= blockCount
               ? 0
               : (blockCount - firstDataBlock - 1) / groupBlocks + 1;
}

std::uint64_t ExtSuperblock::descriptorTableBytes() const
{
    constexpr std::uint64_t largestTable = 64U << 20U;
    const std::uint64_t bytes = productOrGreatest(groups(), descriptorBytes);
    return bytes > largestTable ? 0 : (bytes + blockBytes - 1) / blockBytes * blockBytes;
}

// With sparse backups they are in the groups 1 and all powers of 3, 5 and 7.
std::vector<ByteRange> ExtSuperblock::backups(std::uint64_t availableBytes) const
{
    std::vector<ByteRange> pieces;
    if (!hasSparseBackups || hasFewBackups)
        return pieces;
    const std::uint64_t bytes = blockBytes + (hasMetaGroups ? 0 : descriptorTableBytes());
    for (const std::uint64_t base : {3U, 5U, 7U})
        for (std::uint64_t group = base == 3 ? 1 : base; group < groups(); group *= base) {
            const std::uint64_t start =
                productOrGreatest(firstDataBlock + group * groupBlocks, blockBytes);
            if (start >= availableBytes)
                break;
            pieces.push_back({start, std::min(bytes, availableBytes - start)});
        }
    return pieces;
}

std::optional<ExtSuperblock> readExtSuperblock(int descriptor, std::uint64_t offset,
                                               std::uint64_t availableBytes)
{
    constexpr std::uint64_t primaryOffset = 1024;
    if (availableBytes < primaryOffset + ExtSuperblock::size)
        return std::nullopt;
    if (const auto primary = readAt(descriptor, offset + primaryOffset))
        return primary;
    for (const BackupPlace& place : backupPlaces) {
        if (place.offset + ExtSuperblock::size > availableBytes)
            continue;
        auto backup = readAt(descriptor, offset + place.offset);
        if (backup && backup->blockBytes == place.blockBytes) {
            backup->isBackup = true;
            return backup;
        }
    }
    return std::nullopt;
}

// The kernel brings the superblock's count up to date at unmounting, those of the groups with each
// file.
std::optional<std::uint64_t> countExtFiles(int descriptor, std::uint64_t offset,
                                           const ExtSuperblock& superblock)
{
    constexpr std::uint32_t smallestWithHighHalf = 64;
    const std::uint64_t bytes = superblock.descriptorTableBytes();
    if (superblock.hasMetaGroups || bytes == 0 || superblock.descriptorBytes < 32 ||
        superblock.freeInodes > superblock.inodeCount)
        return std::nullopt;
    const std::uint64_t place =
        (std::uint64_t{superblock.firstDataBlock} + 1) * superblock.blockBytes;
    const auto table = readDisk(descriptor, offset + place, bytes);
    if (!table)
        return std::nullopt;
    std::uint64_t free = 0;
    for (std::uint64_t group = 0; group < superblock.groups(); ++group) {
        const ByteView entry = ByteView(*table).subspan(group * superblock.descriptorBytes,
                                                        superblock.descriptorBytes);
        free += number(entry, 0x0E, 2);
        if (superblock.descriptorBytes >= smallestWithHighHalf)
            free += std::uint64_t{number(entry, 0x2E, 2)} << 16U;
    }
    return free == superblock.freeInodes ? std::optional(superblock.inodeCount - free)
                                         : std::nullopt;
}

bool hasExtBackupSuperblock(int descriptor, ByteRange range)
{
    return std::any_of(backupPlaces.begin(), backupPlaces.end(), [&](const BackupPlace& backup) {
        if (backup.offset + ExtSuperblock::size > range.length)
            return false;
        const auto bytes = readDisk(descriptor, range.offset + backup.offset, ExtSuperblock::size);
        return bytes && number(*bytes, 0x38, 2) == magicNumber && number(*bytes, 0x5A, 2) == 1;
    });
}

}  // namespace pellar
