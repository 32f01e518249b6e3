// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/disks/FormatName.h"

#include <array>
#include <span>

namespace orvane {
namespace {

struct KnownName {
    std::string_view type;
    std::string_view name;
};

std::string nameIn(std::span<const KnownName> names, std::string_view type)
{
    for (const KnownName& known : names)
        if (known.type == type)
            return std::string(known.name);
    return std::string(type);
}

}  // namespace

// The version of FAT is one of these three (libblkid 2.38, superblocks/vfat.c); of what comes from
// outside, nothing else is taken for a name.
std::string formatName(std::string_view type, std::string_view version)
{
    static constexpr std::array names{
        KnownName{"vfat", "FAT"},         KnownName{"msdos", "FAT"},  KnownName{"exfat", "exFAT"},
        KnownName{"ntfs", "NTFS"},        KnownName{"ntfs3", "NTFS"}, KnownName{"xfs", "XFS"},
        KnownName{"btrfs", "Btrfs"},      KnownName{"f2fs", "F2FS"},  KnownName{"jfs", "JFS"},
        KnownName{"iso9660", "ISO 9660"}, KnownName{"udf", "UDF"},
    };
    const std::string name = nameIn(names, type);
    const bool isKind = version == "FAT12" || version == "FAT16" || version == "FAT32";
    return name == "FAT" && isKind ? std::string(version) : name;
}

std::string partitionMapName(std::string_view type)
{
    static constexpr std::array names{KnownName{"gpt", "GPT"}, KnownName{"dos", "MBR"}};
    return nameIn(names, type);
}

}  // namespace orvane
