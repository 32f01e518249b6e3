// SPDX-License-Identifier: Apache-2.0
#include "pellar/disks/DiskUse.h"

#include "pellar/process/KernelFiles.h"

#include <sys/sysmacros.h>

#include <algorithm>
#include <optional>
#include <string>

namespace pellar {
namespace {

std::string_view takeUntil(std::string_view& text, char end)
{
    const std::size_t length = std::min(text.find(end), text.size());
    const std::string_view part = text.substr(0, length);
    text.remove_prefix(std::min(length + 1, text.size()));
    return part;
}

}  // namespace

bool mountInfoNames(std::string_view mountInfo, unsigned major, unsigned minor)
{
    const std::string wanted = std::to_string(major) + ':' + std::to_string(minor);
    while (!mountInfo.empty()) {
        std::string_view line = takeUntil(mountInfo, '\n');
        takeUntil(line, ' ');  // mount ID
        takeUntil(line, ' ');  // parent ID
        if (takeUntil(line, ' ') == wanted)
            return true;
    }
    return false;
}

bool isMounted(dev_t device, const SystemPaths& paths)
{
    const std::optional<std::string> mountInfo = readKernelFile(paths.mountInfo);
    return !mountInfo || mountInfoNames(*mountInfo, major(device), minor(device));
}

}  // namespace pellar
