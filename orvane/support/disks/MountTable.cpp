// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/disks/MountTable.h"

#include "orvane/support/files/WholeFile.h"

#include <algorithm>
#include <sstream>

namespace orvane {
namespace {

bool isOctal(char c)
{
    return c >= '0' && c <= '7';
}

// Space, tab, line feed and backslash are written as "\040" and the like.
std::string unescaped(std::string_view text)
{
    std::string result;
    while (!text.empty()) {
        const bool isEscape = text.size() >= 4 && text[0] == '\\' && isOctal(text[1]) &&
                              isOctal(text[2]) && isOctal(text[3]);
        if (isEscape)
            result += static_cast<char>((text[1] - '0') * 64 + (text[2] - '0') * 8 + text[3] - '0');
        else
            result += text[0];
        text.remove_prefix(isEscape ? 4 : 1);
    }
    return result;
}

bool hasOption(std::string_view options, std::string_view wanted)
{
    return options == wanted || options.starts_with(std::string(wanted) + ',') ||
           options.find(',' + std::string(wanted) + ',') != std::string_view::npos ||
           options.ends_with(',' + std::string(wanted));
}

// 36 35 98:0 /mnt1 /mnt2 rw,noatime master:1 - ext3 /dev/root rw,errors=continue
std::optional<Mount> parseLine(const std::string& line)
{
    std::istringstream fields(line);
    std::string number, parent, device, root, mountPoint, options, optional;
    if (!(fields >> number >> parent >> device >> root >> mountPoint >> options))
        return std::nullopt;
    while (fields >> optional && optional != "-") {
    }
    std::string filesystem, source;
    if (!(fields >> filesystem >> source))
        return std::nullopt;
    return Mount{device,     unescaped(root),   unescaped(mountPoint),
                 filesystem, unescaped(source), hasOption(options, "ro")};
}

/// A device mapper's volume is mounted by its name, which is a link to its node.
std::string nodeOf(const std::string& source)
{
    std::error_code error;
    const auto node = source.starts_with("/dev/") ? std::filesystem::canonical(source, error)
                                                  : std::filesystem::path();
    return node.empty() || error ? source : node.native();
}

bool isWithin(std::string_view path, std::string_view directory)
{
    return directory == "/" || path == directory ||
           (path.starts_with(directory) && path[directory.size()] == '/');
}

}  // namespace

std::vector<Mount> parseMountInfo(std::string_view text)
{
    std::vector<Mount> mounts;
    std::istringstream lines{std::string(text)};
    for (std::string line; std::getline(lines, line);)
        if (auto mount = parseLine(line))
            mounts.push_back(*std::move(mount));
    return mounts;
}

std::vector<Mount> currentMounts()
{
    const auto text = readWholeFile("/proc/self/mountinfo", 16U << 20U);
    auto mounts = text ? parseMountInfo(*text) : std::vector<Mount>();
    for (Mount& mount : mounts)
        mount.source = nodeOf(mount.source);
    return mounts;
}

std::optional<Mount> mountOfDevice(const std::vector<Mount>& mounts, std::string_view device,
                                   const std::filesystem::path& node)
{
    const auto rank = [](const Mount& mount) {
        return mount.mountPoint == "/" ? 2 : mount.root == "/" ? 1 : 0;
    };
    std::optional<Mount> best;
    for (const Mount& mount : mounts) {
        const bool isOfDevice = mount.device == device ||
                                (mount.device.starts_with("0:") && mount.source == node.native());
        if (isOfDevice && (!best || rank(mount) > rank(*best)))
            best = mount;
    }
    return best;
}

std::optional<Mount> mountHolding(const std::vector<Mount>& mounts,
                                  const std::filesystem::path& path)
{
    std::optional<Mount> deepest;
    for (const Mount& mount : mounts) {
        const bool isDeeper = !deepest || mount.mountPoint.size() >= deepest->mountPoint.size();
        if (isWithin(path.native(), mount.mountPoint) && isDeeper)
            deepest = mount;
    }
    return deepest;
}

}  // namespace orvane
