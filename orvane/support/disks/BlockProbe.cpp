// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/disks/BlockProbe.h"

#include <unistd.h>

#include <algorithm>
#include <array>
#include <string_view>

namespace orvane {
namespace {

bool hasBytes(int descriptor, std::uint64_t offset, std::string_view expected)
{
    std::array<char, 16> bytes;
    const ssize_t count =
        ::pread(descriptor, bytes.data(), expected.size(), static_cast<off_t>(offset));
    return count == static_cast<ssize_t>(expected.size()) &&
           std::string_view(bytes.data(), expected.size()) == expected;
}

}  // namespace

bool isBootSector(int descriptor, const PartitionTable& table, const Superblock& superblock)
{
    if (table.type != "dos" || !table.partitions.empty())
        return false;
    // The maker's name of NTFS and exFAT, and where FAT has its own.
    return superblock.isFilesystem() || hasBytes(descriptor, 3, "NTFS    ") ||
           hasBytes(descriptor, 3, "EXFAT   ") || hasBytes(descriptor, 54, "FAT1") ||
           hasBytes(descriptor, 82, "FAT32   ");
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
