// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/ext/ExtFiles.h"

#include "pellar/disks/Readability.h"
#include "pellar/tools/ext/ExtSuperblock.h"

#include <sys/stat.h>

#include <algorithm>
#include <charconv>

namespace pellar {
namespace {

/// Those before it are the volume's own: its journal, its lists of blocks.
constexpr std::uint64_t firstOfFiles = 12;

/// More differ only where no comparison says anything.
constexpr std::size_t mostChanges = 100'000;

/// What an inode says (Linux, Documentation/filesystems/ext4/inodes.rst).
struct Inode {
    std::uint32_t mode;
    std::uint32_t links;
    std::uint32_t deleted;
    std::uint64_t bytes;

    explicit Inode(ByteView raw)
        : mode(static_cast<std::uint32_t>(littleEndian(raw, 0x00, 2))),
          links(static_cast<std::uint32_t>(littleEndian(raw, 0x1A, 2))),
          deleted(static_cast<std::uint32_t>(littleEndian(raw, 0x14, 4))),
          bytes(littleEndian(raw, 0x04, 4))
    {
        if (isRegular())
            bytes |= littleEndian(raw, 0x6C, 4) << 32U;
    }

    bool isRegular() const { return S_ISREG(mode); }
    bool isInUse() const { return mode != 0 && links > 0; }
    /// It is not nonsense, as far as can be seen.
    bool isPlausible() const
    {
        return isInUse() && deleted == 0 && (isRegular() || S_ISDIR(mode) || S_ISLNK(mode));
    }
};

/// Where the inodes of a group stand.
struct InodeTable {
    std::uint64_t place;  ///< bytes from the volume's start
    std::uint64_t firstInode;
    std::uint64_t inodes;
};

/// As the repaired volume says it. None where that makes no sense.
std::vector<InodeTable> inodeTables(int volume, const ExtSuperblock& superblock)
{
    constexpr std::uint32_t smallestWithHighHalf = 64;
    std::vector<InodeTable> tables;
    const std::uint64_t bytes = superblock.descriptorTableBytes();
    if (superblock.hasMetaGroups || bytes == 0 || superblock.descriptorBytes < 32)
        return tables;
    const auto descriptors = readDisk(
        volume, (std::uint64_t{superblock.firstDataBlock} + 1) * superblock.blockBytes, bytes);
    if (!descriptors)
        return tables;
    for (std::uint64_t group = 0; group < superblock.groups(); ++group) {
        const ByteView entry =
            ByteView(*descriptors)
                .subspan(group * superblock.descriptorBytes, superblock.descriptorBytes);
        std::uint64_t block = littleEndian(entry, 0x08, 4);
        if (superblock.descriptorBytes >= smallestWithHighHalf)
            block |= littleEndian(entry, 0x28, 4) << 32U;
        tables.push_back({productOrGreatest(block, superblock.blockBytes),
                          group * superblock.groupInodes + 1, superblock.groupInodes});
    }
    return tables;
}

/// None where nothing is lost. Where nonsense goes, it has no size.
std::optional<FileChange> changeOf(std::uint64_t number, const Inode& before, const Inode& after)
{
    if (number < firstOfFiles || !before.isInUse())
        return std::nullopt;
    if (!after.isInUse())
        return FileChange{
            number, {}, before.isPlausible() ? std::optional(before.bytes) : std::nullopt, {}};
    const bool isSame = before.isPlausible() && before.isRegular() && after.isRegular();
    if (isSame && before.bytes != after.bytes)
        return FileChange{number, {}, before.bytes, after.bytes};
    return std::nullopt;
}

/// Of the inodes that lie, in part at least, in the range.
void addChanges(std::vector<FileChange>& changes, const RepairedVolume& volume,
                const InodeTable& table, std::uint32_t inodeBytes, ByteRange range)
{
    const std::uint64_t tableEnd = table.place + table.inodes * inodeBytes;
    const std::uint64_t start = std::max(range.offset, table.place);
    const std::uint64_t end = std::min(range.offset + range.length, tableEnd);
    if (start >= end || tableEnd > volume.bytes)
        return;
    std::uint64_t index = (start - table.place) / inodeBytes;
    const std::uint64_t indexEnd = (end - table.place + inodeBytes - 1) / inodeBytes;
    for (; index < indexEnd && changes.size() < mostChanges; ++index) {
        const std::uint64_t place = table.place + index * inodeBytes;
        const std::uint64_t number = table.firstInode + index;
        const auto before = readDisk(volume.before, volume.offset + place, inodeBytes);
        const auto after = readDisk(volume.after, place, inodeBytes);
        // Two ranges may touch one inode.
        const bool isKnown = !changes.empty() && changes.back().inode == number;
        if (before && after && !isKnown)
            if (auto change = changeOf(number, Inode(*before), Inode(*after)))
                changes.push_back(*std::move(change));
    }
}

std::vector<FileChange> changes(const RepairedVolume& volume,
                                const std::vector<ByteRange>& differences)
{
    std::vector<FileChange> changes;
    const auto before = readExtSuperblock(volume.before, volume.offset, volume.bytes);
    const auto after = readExtSuperblock(volume.after, 0, volume.bytes);
    if (!before || before->isBackup || before->needsRecovery || !after || after->isBackup ||
        after->inodeBytes < ExtSuperblock::smallestInode || after->groupInodes == 0)
        return changes;
    for (const InodeTable& table : inodeTables(volume.after, *after)) {
        // The first that does not end before the table.
        auto range = std::ranges::lower_bound(
            differences, table.place, std::less_equal(),
            [](const ByteRange& difference) { return difference.offset + difference.length; });
        const std::uint64_t tableBytes = productOrGreatest(table.inodes, after->inodeBytes);
        for (; range != differences.end() && range->offset < table.place + tableBytes; ++range)
            addChanges(changes, volume, table, after->inodeBytes, *range);
    }
    return changes;
}

std::vector<std::string> arguments(const std::string& disk, std::uint64_t offset,
                                   const std::vector<FileChange>& files)
{
    std::string request = "ncheck";
    for (const FileChange& file : files)
        request += " " + std::to_string(file.inode);
    // -c: the maps of what is free may be damaged, and are not needed.
    return {"-c", "-R", request, offset == 0 ? disk : disk + "?offset=" + std::to_string(offset)};
}

/// "16\t/path/file", "12\t//file" of the root's own (debugfs 1.47.0)
std::optional<FileChange> nameIn(std::string_view line)
{
    FileChange file;
    const char* const end = line.data() + line.size();
    const auto [tab, error] = std::from_chars(line.data(), end, file.inode);
    if (error != std::errc() || tab == end || *tab != '\t')
        return std::nullopt;
    const bool isInRoot = std::string_view(tab + 1, end).starts_with("//");
    file.name = std::string(tab + (isInRoot ? 2 : 1), end);
    return file;
}

}  // namespace

const FileComparison& extFiles()
{
    static constexpr FileComparison comparison{changes, "debugfs", arguments, nameIn};
    return comparison;
}

}  // namespace pellar
