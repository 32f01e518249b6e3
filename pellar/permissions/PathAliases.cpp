// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/PathAliases.h"

#include "pellar/permissions/Lines.h"

namespace pellar {

std::string withoutSlashes(std::string_view path)
{
    std::string result;
    while (!path.empty()) {
        const std::string_view part = takeField(path, '/');
        if (part.empty() || part == ".")
            continue;
        result += result.empty() ? "" : "/";
        result += part;
    }
    return result;
}

void PathAliases::add(const std::string& link, std::string target)
{
    const std::size_t slash = link.rfind('/');
    if (!target.starts_with('/') && slash != std::string::npos)
        target = link.substr(0, slash + 1) + target;
    target = withoutSlashes(target);
    if (!target.empty() && target.find("..") == std::string::npos && target != link)
        aliases_[link] = target;
}

std::string PathAliases::canonical(std::string_view path) const
{
    constexpr int mostLinks = 4;  // sbin → usr/sbin → usr/bin
    std::string result = withoutSlashes(path);
    for (int i = 0; i < mostLinks; ++i)
        result = once(result);
    return result;
}

std::string PathAliases::once(const std::string& path) const
{
    for (const auto& [link, target] : aliases_)
        if (path.starts_with(link) && (path.size() == link.size() || path[link.size()] == '/'))
            return target + path.substr(link.size());
    return path;
}

}  // namespace pellar
