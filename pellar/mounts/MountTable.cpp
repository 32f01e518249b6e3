// SPDX-License-Identifier: Apache-2.0
#include "pellar/mounts/MountTable.h"

#include <libmount/libmount.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>

#include <algorithm>
#include <cstdio>
#include <memory>
#include <system_error>

namespace pellar {
namespace {

struct Free {
    void operator()(libmnt_table* table) const { mnt_unref_table(table); }
    void operator()(libmnt_iter* iterator) const { mnt_free_iter(iterator); }
    void operator()(std::FILE* stream) const { std::fclose(stream); }
};

std::string textOf(const char* text)
{
    return text != nullptr ? text : "";
}

/// 0 where the library answers a failure.
std::uint64_t numberOf(int id)
{
    return id > 0 ? static_cast<std::uint64_t>(id) : 0;
}

/// Without those that the kernel tells but does not take (a security module's own).
std::string mountableOptions(std::string_view options)
{
    std::string kept;
    while (!options.empty()) {
        const std::size_t length = std::min(options.find(','), options.size());
        const std::string_view option = options.substr(0, length);
        options.remove_prefix(std::min(length + 1, options.size()));
        if (option != "seclabel" && !option.empty())
            kept += (kept.empty() ? "" : ",") + std::string(option);
    }
    return kept;
}

Mount mountFrom(libmnt_fs& entry)
{
    const std::string own = textOf(mnt_fs_get_vfs_options(&entry));
    return {mnt_fs_get_devno(&entry),
            textOf(mnt_fs_get_source(&entry)),
            textOf(mnt_fs_get_target(&entry)),
            textOf(mnt_fs_get_root(&entry)),
            textOf(mnt_fs_get_fstype(&entry)),
            mountableOptions(textOf(mnt_fs_get_options(&entry))),
            mnt_optstr_get_option(own.c_str(), "ro", nullptr, nullptr) == 0,
            numberOf(mnt_fs_get_id(&entry)),
            numberOf(mnt_fs_get_parent_id(&entry))};
}

/// None when the library cannot.
std::optional<std::vector<Mount>> parsed(std::string_view mountInfo)
{
    std::string text(mountInfo);
    std::vector<Mount> mounts;
    if (text.empty())
        return mounts;
    const std::unique_ptr<std::FILE, Free> stream(::fmemopen(text.data(), text.size(), "r"));
    const std::unique_ptr<libmnt_table, Free> table(mnt_new_table());
    const std::unique_ptr<libmnt_iter, Free> iterator(mnt_new_iter(MNT_ITER_FORWARD));
    if (!stream || !table || !iterator ||
        mnt_table_parse_stream(table.get(), stream.get(), "mountinfo") != 0)
        return std::nullopt;
    libmnt_fs* entry = nullptr;
    while (mnt_table_next_fs(table.get(), iterator.get(), &entry) == 0)
        mounts.push_back(mountFrom(*entry));
    return mounts;
}

std::optional<std::vector<Mount>> readMounts(const SystemPaths& paths)
{
    const std::optional<std::string> mountInfo = readKernelFile(paths.mountInfo);
    return mountInfo ? parsed(*mountInfo) : std::nullopt;
}

bool isIn(std::string_view path, std::string_view directory)
{
    return path.starts_with(directory) &&
           (directory == "/" || path.size() == directory.size() || path[directory.size()] == '/');
}

bool isOn(const Mount& mount, dev_t device)
{
    struct stat status = {};
    return mount.device == device ||
           (mount.source.starts_with('/') && ::stat(mount.source.c_str(), &status) == 0 &&
            S_ISBLK(status.st_mode) && status.st_rdev == device);
}

/// A device mapper's volume is mounted by its name, which is a link to its node.
bool leadsTo(const std::string& source, const std::filesystem::path& node)
{
    std::error_code error;
    return source == node ||
           (source.starts_with("/dev/") && std::filesystem::canonical(source, error) == node);
}

}  // namespace

std::vector<Mount> parseMounts(std::string_view mountInfo)
{
    return parsed(mountInfo).value_or(std::vector<Mount>());
}

std::vector<Mount> currentMounts(const SystemPaths& paths)
{
    return readMounts(paths).value_or(std::vector<Mount>());
}

bool isMounted(dev_t device, const SystemPaths& paths)
{
    const auto mounts = readMounts(paths);
    return !mounts || std::any_of(mounts->begin(), mounts->end(),
                                  [device](const Mount& mount) { return mount.device == device; });
}

std::vector<Mount> mountsOf(dev_t device, const SystemPaths& paths)
{
    auto mounts = currentMounts(paths);
    std::erase_if(mounts, [device](const Mount& mount) { return !isOn(mount, device); });
    return mounts;
}

std::vector<Mount> mountsOf(const std::filesystem::path& node, const SystemPaths& paths)
{
    struct stat status = {};
    if (::stat(node.c_str(), &status) != 0 || !S_ISBLK(status.st_mode))
        return {};
    return mountsOf(status.st_rdev, paths);
}

std::optional<Mount> mountOfDevice(const std::vector<Mount>& mounts, dev_t device,
                                   const std::filesystem::path& node)
{
    const auto rank = [](const Mount& mount) {
        return mount.target == "/" ? 2 : mount.root == "/" ? 1 : 0;
    };
    std::optional<Mount> best;
    for (const Mount& mount : mounts) {
        const bool isOfDevice =
            mount.device == device || (major(mount.device) == 0 && leadsTo(mount.source, node));
        if (isOfDevice && (!best || rank(mount) > rank(*best)))
            best = mount;
    }
    return best;
}

// Of several the deepest, and of these the last, which lies on top.
std::optional<Mount> mountHolding(const std::vector<Mount>& mounts,
                                  const std::filesystem::path& path)
{
    std::error_code ignored;
    const std::string canonical = std::filesystem::weakly_canonical(path, ignored);
    std::optional<Mount> holder;
    for (const Mount& mount : mounts)
        if (isIn(canonical, mount.target) &&
            (!holder || mount.target.size() >= holder->target.size()))
            holder = mount;
    return holder;
}

}  // namespace pellar
