// SPDX-License-Identifier: Apache-2.0
#include "pellar/mounts/MountPlace.h"

#include <libmount/libmount.h>
#include <sys/stat.h>

#include <algorithm>
#include <functional>
#include <memory>

namespace pellar {
namespace {

struct Unref {
    void operator()(libmnt_table* table) const { mnt_unref_table(table); }
    void operator()(libmnt_iter* iterator) const { mnt_free_iter(iterator); }
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

/// Every entry, in the kernel's order, with libmount's notes about the options that are no
/// kernel's (/run/mount/utab).
void forEachMount(const SystemPaths& paths, const std::function<void(libmnt_fs&)>& visit)
{
    const std::unique_ptr<libmnt_table, Unref> table(mnt_new_table());
    const std::unique_ptr<libmnt_iter, Unref> iterator(mnt_new_iter(MNT_ITER_FORWARD));
    const bool isSystems = paths.mountInfo == SystemPaths().mountInfo;
    if (!table || !iterator ||
        (isSystems ? mnt_table_parse_mtab(table.get(), nullptr)
                   : mnt_table_parse_file(table.get(), paths.mountInfo.c_str())) != 0)
        return;
    libmnt_fs* mount = nullptr;
    while (mnt_table_next_fs(table.get(), iterator.get(), &mount) == 0)
        visit(*mount);
}

bool isIn(std::string_view path, std::string_view directory)
{
    return path.starts_with(directory) &&
           (directory == "/" || path.size() == directory.size() || path[directory.size()] == '/');
}

bool isOn(libmnt_fs& mount, dev_t device)
{
    if (mnt_fs_get_devno(&mount) == device)
        return true;
    const std::string source = textOf(mnt_fs_get_source(&mount));
    struct stat status = {};
    return source.starts_with('/') && ::stat(source.c_str(), &status) == 0 &&
           S_ISBLK(status.st_mode) && status.st_rdev == device;
}

}  // namespace

std::vector<MountPlace> mountPlacesOf(dev_t device, const SystemPaths& paths)
{
    std::vector<MountPlace> places;
    forEachMount(paths, [&](libmnt_fs& mount) {
        if (isOn(mount, device))
            places.push_back({textOf(mnt_fs_get_source(&mount)), textOf(mnt_fs_get_target(&mount)),
                              textOf(mnt_fs_get_root(&mount)), textOf(mnt_fs_get_fstype(&mount)),
                              mountableOptions(textOf(mnt_fs_get_options(&mount))),
                              numberOf(mnt_fs_get_id(&mount)),
                              numberOf(mnt_fs_get_parent_id(&mount))});
    });
    return places;
}

std::vector<MountPlace> mountPlacesOf(const std::filesystem::path& node, const SystemPaths& paths)
{
    struct stat status = {};
    if (::stat(node.c_str(), &status) != 0 || !S_ISBLK(status.st_mode))
        return {};
    return mountPlacesOf(status.st_rdev, paths);
}

bool holdsDirectory(const std::vector<MountPlace>& places, const std::filesystem::path& directory,
                    const SystemPaths& paths)
{
    std::error_code ignored;
    const std::string path = std::filesystem::weakly_canonical(directory, ignored);
    std::string holder;  // of several the deepest, and of these the last, which lies on top
    forEachMount(paths, [&](libmnt_fs& mount) {
        const std::string target = textOf(mnt_fs_get_target(&mount));
        if (isIn(path, target) && target.size() >= holder.size())
            holder = target;
    });
    return !holder.empty() &&
           std::any_of(places.begin(), places.end(),
                       [&](const MountPlace& place) { return place.target == holder; });
}

std::vector<std::string> mountsBelow(std::string_view directory, const SystemPaths& paths)
{
    const std::string prefix = std::string(directory) + '/';
    std::vector<std::string> targets;
    forEachMount(paths, [&](libmnt_fs& mount) {
        const std::string target = textOf(mnt_fs_get_target(&mount));
        if (target.starts_with(prefix))
            targets.push_back(target);
    });
    return targets;
}

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

}  // namespace pellar
