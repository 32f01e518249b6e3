// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/ToolTable.h"

#include "pellar/tools/E2fsck.h"

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
    static const E2fsck e2fsck;
    static const std::array table{Row{"ext2", &e2fsck}, Row{"ext3", &e2fsck}, Row{"ext4", &e2fsck}};
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

}  // namespace pellar
