// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/ToolTable.h"

#include <algorithm>
#include <array>

namespace pellar {
namespace {

struct Row {
    std::string_view filesystemType;
    const Tool* tool;
};

const auto& rows()
{
    // The surest signs first; a FAT volume has no magic number of its own.
    static const std::array table{
        Row{"ext2", &e2fsck()},   Row{"ext3", &e2fsck()},      Row{"ext4", &e2fsck()},
        Row{"xfs", &xfsRepair()}, Row{"btrfs", &btrfsCheck()}, Row{"f2fs", &fsckF2fs()},
        Row{"ntfs", &ntfs()},     Row{"exfat", &fsckExfat()},  Row{"vfat", &fsckFat()},
    };
    return table;
}

}  // namespace

const Tool* toolFor(std::string_view filesystemType)
{
    const auto found = std::find_if(rows().begin(), rows().end(), [filesystemType](const Row& row) {
        return row.filesystemType == filesystemType;
    });
    return found == rows().end() ? nullptr : found->tool;
}

const std::vector<const Tool*>& allTools()
{
    static const std::vector<const Tool*> tools = [] {
        std::vector<const Tool*> distinct;
        for (const Row& row : rows())
            if (std::find(distinct.begin(), distinct.end(), row.tool) == distinct.end())
                distinct.push_back(row.tool);
        return distinct;
    }();
    return tools;
}

const Tool* toolRecognizing(int disk, std::uint64_t offset, std::uint64_t availableBytes)
{
    for (const Tool* const tool : allTools())
        if (tool->examine(disk, offset, availableBytes).isRecognized)
            return tool;
    return nullptr;
}

}  // namespace pellar
