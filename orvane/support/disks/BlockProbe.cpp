// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/disks/BlockProbe.h"

#include <blkid/blkid.h>
#include <unistd.h>

#include <fmt/format.h>
#include <algorithm>
#include <array>
#include <memory>
#include <set>
#include <string_view>

namespace orvane {
namespace {

constexpr std::uint64_t sectorBytes = 512;  // the unit of libblkid's partitions

struct FreeProbe {
    void operator()(blkid_probe probe) const { blkid_free_probe(probe); }
};
using Probe = std::unique_ptr<std::remove_pointer_t<blkid_probe>, FreeProbe>;

Probe probeOf(int descriptor, ByteRange range)
{
    Probe probe(blkid_new_probe());
    if (probe &&
        blkid_probe_set_device(probe.get(), descriptor, static_cast<blkid_loff_t>(range.offset),
                               static_cast<blkid_loff_t>(range.length)) != 0)
        probe.reset();
    return probe;
}

std::string valueOf(const Probe& probe, const char* name)
{
    const char* data = nullptr;
    std::size_t size = 0;
    if (blkid_probe_lookup_value(probe.get(), name, &data, &size) != 0 || data == nullptr)
        return {};
    // The size counts the terminating zero of text.
    std::string value(data, size);
    while (value.ends_with('\0'))
        value.pop_back();
    return value;
}

std::string textOrNothing(const char* text)
{
    return text != nullptr ? text : "";
}

Partition read(blkid_partition entry, const std::set<blkid_partition>& containers)
{
    Partition partition;
    partition.number = blkid_partition_get_partno(entry);
    partition.range = {static_cast<std::uint64_t>(blkid_partition_get_start(entry)) * sectorBytes,
                       static_cast<std::uint64_t>(blkid_partition_get_size(entry)) * sectorBytes};
    partition.isContainer = blkid_partition_is_extended(entry) != 0 || containers.contains(entry);
    const char* const guid = blkid_partition_get_type_string(entry);
    partition.type = guid != nullptr ? guid : fmt::format("{:#x}", blkid_partition_get_type(entry));
    partition.name = textOrNothing(blkid_partition_get_name(entry));
    return partition;
}

// Tables may be nested: a BSD disklabel lies inside a partition of an MBR.
std::set<blkid_partition> containersIn(blkid_partlist list)
{
    std::set<blkid_partition> containers;
    for (int i = 0; i < blkid_partlist_numof_partitions(list); ++i) {
        blkid_partition entry = blkid_partlist_get_partition(list, i);
        if (blkid_parttable table = blkid_partition_get_table(entry))
            if (blkid_partition parent = blkid_parttable_get_parent(table))
                containers.insert(parent);
    }
    return containers;
}

bool hasBytes(int descriptor, std::uint64_t offset, std::string_view expected)
{
    std::array<char, 16> bytes;
    const ssize_t count =
        ::pread(descriptor, bytes.data(), expected.size(), static_cast<off_t>(offset));
    return count == static_cast<ssize_t>(expected.size()) &&
           std::string_view(bytes.data(), expected.size()) == expected;
}

}  // namespace

Superblock readSuperblock(int descriptor, ByteRange range)
{
    const Probe probe = range.length > 0 ? probeOf(descriptor, range) : nullptr;
    if (!probe)
        return {};
    blkid_probe_enable_superblocks(probe.get(), 1);
    blkid_probe_set_superblocks_flags(probe.get(), BLKID_SUBLKS_TYPE | BLKID_SUBLKS_USAGE |
                                                       BLKID_SUBLKS_LABEL | BLKID_SUBLKS_UUID);
    if (blkid_do_safeprobe(probe.get()) != 0)
        return {};
    return {valueOf(probe, "USAGE"), valueOf(probe, "TYPE"), valueOf(probe, "LABEL"),
            valueOf(probe, "UUID")};
}

std::optional<PartitionTable> readPartitionTable(int descriptor)
{
    const Probe probe = probeOf(descriptor, {});
    if (!probe)
        return std::nullopt;
    blkid_probe_enable_superblocks(probe.get(), 0);
    blkid_probe_enable_partitions(probe.get(), 1);
    blkid_partlist list = blkid_probe_get_partitions(probe.get());
    blkid_parttable table = list != nullptr ? blkid_partlist_get_table(list) : nullptr;
    if (table == nullptr)
        return std::nullopt;

    PartitionTable result{textOrNothing(blkid_parttable_get_type(table)), {}};
    const std::set<blkid_partition> containers = containersIn(list);
    for (int i = 0; i < blkid_partlist_numof_partitions(list); ++i)
        result.partitions.push_back(read(blkid_partlist_get_partition(list, i), containers));
    return result;
}

// ext4(5) and mke2fs(8): the first backup stands at the start of group 1, which is 8193 blocks of
// 1 KiB, 16384 of 2 KiB or 32768 of 4 KiB from the start. The magic number 0xEF53 lies 56 bytes
// into the superblock, its group's number (here 1) 90 bytes into it.
bool isBootSector(int descriptor, const PartitionTable& table, const Superblock& superblock)
{
    if (table.type != "dos" || !table.partitions.empty())
        return false;
    // The maker's name of NTFS and exFAT, and where FAT has its own.
    return superblock.isFilesystem() || hasBytes(descriptor, 3, "NTFS    ") ||
           hasBytes(descriptor, 3, "EXFAT   ") || hasBytes(descriptor, 54, "FAT1") ||
           hasBytes(descriptor, 82, "FAT32   ");
}

bool hasExtBackupSuperblock(int descriptor, ByteRange range)
{
    constexpr std::array<std::uint64_t, 3> firstBackups{8193ULL << 10U, 16384ULL << 11U,
                                                        32768ULL << 12U};
    return std::any_of(firstBackups.begin(), firstBackups.end(), [&](std::uint64_t backup) {
        return backup + 1024 <= range.length &&
               hasBytes(descriptor, range.offset + backup + 56, "\x53\xEF") &&
               hasBytes(descriptor, range.offset + backup + 90, std::string_view("\1\0", 2));
    });
}

bool hasPartitionTableTraces(int descriptor)
{
    // UEFI Specification 2.10, 5.2.1 and 5.3.2: four entries of 16 bytes in the MBR, their types 4
    // bytes into each; the headers in block 1 and in the last, of 512 or 4096 bytes.
    const bool hasMBR = hasBytes(descriptor, 510, "\x55\xAA");
    for (std::uint64_t entry = 446; hasMBR && entry < 510; entry += 16)
        if (!hasBytes(descriptor, entry + 4, std::string_view("\0", 1)))
            return true;
    const off_t end = ::lseek(descriptor, 0, SEEK_END);
    const std::uint64_t length = end < 0 ? 0 : static_cast<std::uint64_t>(end);
    for (const std::uint64_t block : {512U, 4096U})
        if (hasBytes(descriptor, block, "EFI PART") ||
            (length >= 2 * block && hasBytes(descriptor, (length / block - 1) * block, "EFI PART")))
            return true;
    return false;
}

bool announcesFilesystem(const Partition& partition)
{
    // Types of the MBR as fdisk(8) lists them, and of the UEFI and Discoverable Partitions
    // Specifications: FAT and NTFS, Linux data, root, home, srv, var, EFI system, Microsoft data.
    static constexpr std::array<std::string_view, 24> types{"0x1",
                                                            "0x4",
                                                            "0x6",
                                                            "0x7",
                                                            "0xb",
                                                            "0xc",
                                                            "0xe",
                                                            "0x11",
                                                            "0x14",
                                                            "0x16",
                                                            "0x1b",
                                                            "0x1c",
                                                            "0x1e",
                                                            "0x83",
                                                            "0xef",
                                                            "0x93",
                                                            "0fc63daf-8483-4772-8e79-3d69d8477de4",
                                                            "4f68bce3-e8cd-4db1-96e7-fbcaf984b709",
                                                            "933ac7e1-2eb4-4f13-b844-0e14e2aef915",
                                                            "3b8f8425-20e0-4f3b-907f-1a25a76f98e8",
                                                            "4d21b016-b534-45c2-a9fb-5c16e091fd2d",
                                                            "c12a7328-f81f-11d2-ba4b-00a0c93ec93b",
                                                            "ebd0a0a2-b9e5-4433-87c0-68b6b72699c7",
                                                            "b921b045-1df0-41c3-af44-4c6f280d3fae"};
    return std::find(types.begin(), types.end(), partition.type) != types.end();
}

}  // namespace orvane
