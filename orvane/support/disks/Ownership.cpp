// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/disks/Ownership.h"

#include <algorithm>
#include <array>

namespace orvane {

bool hasOwners(std::string_view filesystemType)
{
    constexpr std::array<std::string_view, 13> types{
        "ext2",   "ext3", "ext4",     "xfs",      "btrfs", "f2fs",    "jfs",
        "nilfs2", "zfs",  "bcachefs", "reiserfs", "erofs", "squashfs"};
    return std::find(types.begin(), types.end(), filesystemType) != types.end();
}

}  // namespace orvane
