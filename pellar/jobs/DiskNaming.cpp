// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/DiskNaming.h"

#include "pellar/process/ChildProcess.h"

#include <algorithm>

namespace pellar {
namespace {

std::size_t leadingDigits(std::string_view text)
{
    return std::min(text.find_first_not_of("0123456789"), text.size());
}

}  // namespace

std::string diskArgumentOfTool()
{
    return pathOfDescriptor(diskDescriptorOfTool);
}

std::string withDiskName(std::string_view line, std::string_view diskName)
{
    constexpr std::string_view offset = "?offset=";
    static const std::string argument = diskArgumentOfTool();
    std::string result;
    for (std::size_t at = line.find(argument); at != std::string_view::npos;
         at = line.find(argument)) {
        const bool isOurs = leadingDigits(line.substr(at + argument.size())) == 0;
        result += line.substr(0, at);
        result += isOurs ? diskName : std::string_view(argument);
        line.remove_prefix(at + argument.size());
        if (isOurs && line.starts_with(offset))
            line.remove_prefix(offset.size() + leadingDigits(line.substr(offset.size())));
    }
    return result.append(line);
}

}  // namespace pellar
