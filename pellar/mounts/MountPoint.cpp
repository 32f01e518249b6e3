// SPDX-License-Identifier: Apache-2.0
#include "pellar/mounts/MountPoint.h"

#include <fcntl.h>
#include <libmount/libmount.h>
#include <linux/openat2.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/sysmacros.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <charconv>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <utility>

namespace pellar {
namespace {

constexpr int onlyToName = O_PATH | O_NOFOLLOW | O_CLOEXEC;

FileDescriptor openWith(int directory, const char* way, std::uint64_t resolve) noexcept
{
    open_how how = {};
    how.flags = onlyToName;
    how.resolve = resolve;
    return FileDescriptor(
        static_cast<int>(::syscall(SYS_openat2, directory, way, &how, sizeof how)));
}

FileDescriptor openIn(const FileDescriptor& directory, const char* name) noexcept
{
    return FileDescriptor(::openat(directory.get(), name, onlyToName));
}

/// All zero when there is nothing.
struct statx statusOf(const FileDescriptor& file) noexcept
{
    struct statx status = {};
    if (::statx(file.get(), "", AT_EMPTY_PATH, STATX_BASIC_STATS | STATX_BTIME | STATX_MNT_ID,
                &status) != 0)
        status = {};
    return status;
}

/// Its number, as in /proc/self/mountinfo; 0 from a kernel before 5.8 (statx(2)).
std::uint64_t mountOf(const struct statx& status) noexcept
{
    return (status.stx_mask & STATX_MNT_ID) != 0 ? status.stx_mnt_id : 0;
}

bool isRootOfMount(const struct statx& status) noexcept
{
    return (status.stx_attributes & STATX_ATTR_MOUNT_ROOT) != 0;
}

MountPoint::Directory directoryFrom(const struct statx& status) noexcept
{
    const bool isBirthKnown = (status.stx_mask & STATX_BTIME) != 0;
    return {makedev(status.stx_dev_major, status.stx_dev_minor), status.stx_ino,
            isBirthKnown ? status.stx_btime.tv_sec * 1'000'000'000 + status.stx_btime.tv_nsec : 0,
            status.stx_mode};
}

// A file system without a device of its own (btrfs) has another device number each time it is
// mounted, so the number says nothing about a directory on the disk itself.
bool isSame(const MountPoint& point, const struct statx& shown) noexcept
{
    if (point.below.inode == 0)
        return isRootOfMount(shown) && mountOf(shown) == point.belowMount;
    const MountPoint::Directory directory = directoryFrom(shown);
    return !isRootOfMount(shown) && directory.inode == point.below.inode &&
           directory.born == point.below.born &&
           (directory.mode & S_IFMT) == (point.below.mode & S_IFMT) &&
           (point.outer != MountPoint::none || directory.device == point.below.device);
}

bool belongsToRootAlone(const struct statx& directory) noexcept
{
    return S_ISDIR(directory.stx_mode) && directory.stx_uid == 0 &&
           (directory.stx_mode & (S_IWGRP | S_IWOTH)) == 0;
}

FileDescriptor openHolder(std::span<const MountPoint> points, std::size_t index) noexcept
{
    const MountPoint& point = points[index];
    if (point.outer == MountPoint::none)
        return FileDescriptor(::fcntl(point.holder.get(), F_DUPFD_CLOEXEC, 0));
    const FileDescriptor outer = openShown(points, point.outer);
    return outer ? openBelow(outer.get(), point.way.c_str()) : FileDescriptor();
}

/// The directory below what is mounted, in a copy of the mount that it is on: the copy has nothing
/// mounted in it (open_tree(2)).
Result<MountPoint::Directory, int> directoryBelow(const FileDescriptor& holder,
                                                  const std::string& name)
{
    const FileDescriptor copy(
        ::open_tree(holder.get(), "", OPEN_TREE_CLONE | OPEN_TREE_CLOEXEC | AT_EMPTY_PATH));
    if (!copy)
        return errno;
    const FileDescriptor directory = openIn(copy, name.c_str());
    if (!directory)
        return errno;
    return directoryFrom(statusOf(directory));
}

/// On which of the places another one lies.
std::size_t outerOf(const Mount& place, const std::vector<Mount>& places)
{
    const auto outer = std::find_if(places.begin(), places.end(), [&place](const Mount& other) {
        return other.id != 0 && other.id == place.parent;
    });
    return outer == places.end() ? MountPoint::none
                                 : static_cast<std::size_t>(outer - places.begin());
}

/// 0, or an errno value.
int hold(MountPoint& point, const Mount& place, const std::vector<Mount>& places)
{
    const std::filesystem::path target = place.target;
    point.name = target.filename();
    point.mount = place.id;
    point.outer = outerOf(place, places);
    FileDescriptor holder = openWith(AT_FDCWD, target.parent_path().c_str(), RESOLVE_NO_SYMLINKS);
    if (!holder)
        return errno;
    if (point.name.empty() || place.id == 0 ||
        (point.outer != MountPoint::none && places[point.outer].target == place.target))
        return ENOTSUP;
    const struct statx shown = statusOf(openIn(holder, point.name.c_str()));
    if ((shown.stx_mask & STATX_MNT_ID) == 0)
        return ENOSYS;
    if (shown.stx_mnt_id != place.id)
        return EBUSY;
    if (mountOf(statusOf(holder)) == place.parent) {
        auto below = directoryBelow(holder, point.name);
        if (!below)
            return below.error();
        point.below = *below;
    }
    if (point.outer == MountPoint::none) {
        point.belowMount = place.parent;
        point.holder = std::move(holder);
    } else {
        const auto way = target.parent_path().lexically_relative(places[point.outer].target);
        point.way = way.native();
    }
    return 0;
}

struct Free {
    void operator()(char* text) const { std::free(text); }
};
using OwnedText = std::unique_ptr<char, Free>;

/// What is the kernel's in general becomes flags, what is the file system's stays text, and what
/// only programs understand (x-…, user, _netdev) is left out.
void setOptions(MountCall& call, const std::string& options)
{
    char* general = nullptr;
    char* own = nullptr;
    if (mnt_split_optstr(options.c_str(), nullptr, &general, &own, 0, 0) != 0)
        return;
    const OwnedText generalOwner(general);
    const OwnedText ownOwner(own);
    call.data = own != nullptr ? own : "";
    if (general != nullptr)
        mnt_optstr_get_flags(general, &call.flags, mnt_get_builtin_optmap(MNT_LINUX_MAP));
}

int mountDevice(const MountCall& call, const FileDescriptor& place) noexcept
{
    return ::mount(call.source.c_str(), DescriptorPath(place.get()).get(), call.filesystem.c_str(),
                   call.flags, call.data.c_str()) == 0
               ? 0
               : errno;
}

/// What a mount has of its own, whatever the file system's are.
mount_attr attributesFrom(unsigned long flags) noexcept
{
    struct Attribute {
        unsigned long flag;
        std::uint64_t attribute;
    };
    mount_attr attributes = {};
    for (const Attribute& known : {Attribute{MS_RDONLY, MOUNT_ATTR_RDONLY},
                                   {MS_NOSUID, MOUNT_ATTR_NOSUID},
                                   {MS_NODEV, MOUNT_ATTR_NODEV},
                                   {MS_NOEXEC, MOUNT_ATTR_NOEXEC},
                                   {MS_NODIRATIME, MOUNT_ATTR_NODIRATIME},
                                   {MS_NOSYMFOLLOW, MOUNT_ATTR_NOSYMFOLLOW}}) {
        attributes.attr_clr |= known.attribute;
        attributes.attr_set |= (flags & known.flag) != 0 ? known.attribute : 0;
    }
    attributes.attr_clr |= MOUNT_ATTR__ATIME;
    attributes.attr_set |= (flags & MS_NOATIME) != 0       ? MOUNT_ATTR_NOATIME
                           : (flags & MS_STRICTATIME) != 0 ? MOUNT_ATTR_STRICTATIME
                                                           : MOUNT_ATTR_RELATIME;
    return attributes;
}

// Made ready before it can be seen: at no moment has it fewer restrictions than it had.
int bindPart(const MountCalls& calls, const MountCall& call, const FileDescriptor& place) noexcept
{
    if (!isMounted(calls.points, calls.whole))
        return ENOENT;
    const FileDescriptor whole = openShown(calls.points, calls.whole);
    const FileDescriptor part =
        whole ? openBelow(whole.get(), call.source.c_str()) : FileDescriptor();
    if (!part)
        return errno;
    const FileDescriptor copy(
        ::open_tree(part.get(), "", OPEN_TREE_CLONE | OPEN_TREE_CLOEXEC | AT_EMPTY_PATH));
    mount_attr attributes = attributesFrom(call.flags);
    const bool isDone =
        copy &&
        ::mount_setattr(copy.get(), "", AT_EMPTY_PATH, &attributes, sizeof attributes) == 0 &&
        ::move_mount(copy.get(), "", place.get(), "",
                     MOVE_MOUNT_F_EMPTY_PATH | MOVE_MOUNT_T_EMPTY_PATH) == 0;
    return isDone ? 0 : errno;
}

}  // namespace

Result<std::vector<MountPoint>, NotHeld> holdMountPoints(const std::vector<Mount>& places)
{
    std::vector<MountPoint> points(places.size());
    for (std::size_t i = 0; i < places.size(); ++i)
        if (const int error = hold(points[i], places[i], places))
            return NotHeld{i, error};
    return points;
}

FileDescriptor openBelow(int directory, const char* way) noexcept
{
    return openWith(directory, way, RESOLVE_BENEATH | RESOLVE_NO_SYMLINKS | RESOLVE_NO_MAGICLINKS);
}

FileDescriptor openShown(std::span<const MountPoint> points, std::size_t index) noexcept
{
    const FileDescriptor holder = openHolder(points, index);
    return holder ? openIn(holder, points[index].name.c_str()) : FileDescriptor();
}

bool isMounted(std::span<const MountPoint> points, std::size_t index) noexcept
{
    const struct statx shown = statusOf(openShown(points, index));
    return isRootOfMount(shown) && mountOf(shown) != points[index].belowMount;
}

// What is to be unmounted must not be open, so it is named by the directory that it is in.
int unmount(std::span<const MountPoint> points, std::size_t index) noexcept
{
    const FileDescriptor holder = openHolder(points, index);
    if (!holder)
        return errno;
    const char* const name = points[index].name.c_str();
    if (mountOf(statusOf(openIn(holder, name))) != points[index].mount)
        return ESTALE;
    return ::umount2(DescriptorPath(holder.get(), name).get(), UMOUNT_NOFOLLOW) == 0 ? 0 : errno;
}

FileDescriptor openToMountOn(std::span<const MountPoint> points, std::size_t index) noexcept
{
    const MountPoint& point = points[index];
    const FileDescriptor holder = openHolder(points, index);
    if (!holder)
        return {};
    const struct statx status = statusOf(holder);
    const bool isRoots = belongsToRootAlone(status);
    FileDescriptor directory = openIn(holder, point.name.c_str());
    if (!directory && errno == ENOENT && isRoots && S_ISDIR(point.below.mode) &&
        ::mkdirat(holder.get(), point.name.c_str(), point.below.mode & 07777U) == 0)
        directory = openIn(holder, point.name.c_str());
    if (!directory)
        return {};
    const struct statx shown = statusOf(directory);
    const bool isMadeAnew = isRoots && S_ISDIR(shown.stx_mode) && !isRootOfMount(shown);
    if (isMadeAnew || isSame(point, shown))
        return directory;
    errno = ESTALE;
    return {};
}

DescriptorPath::DescriptorPath(int descriptor, const char* name) noexcept
{
    constexpr char directory[] = "/proc/self/fd/";
    std::memcpy(text_, directory, sizeof directory);
    char* end = std::to_chars(text_ + sizeof directory - 1, text_ + sizeof text_, descriptor).ptr;
    *end = '\0';
    if (name == nullptr)
        return;
    *end++ = '/';
    const std::size_t room = static_cast<std::size_t>(text_ + sizeof text_ - end);
    std::memcpy(end, name, ::strnlen(name, room - 1) + 1);
    text_[sizeof text_ - 1] = '\0';
}

Result<MountCalls, NotHeld> mountCallsFor(const std::vector<Mount>& places)
{
    auto points = holdMountPoints(places);
    if (!points)
        return points.error();
    MountCalls all;
    all.points = *std::move(points);
    for (const Mount& place : places) {
        if (!place.isBind() && all.whole == MountPoint::none)
            all.whole = all.calls.size();
        MountCall call{place.source, place.target, place.filesystem, {}, 0, place.isBind()};
        if (call.isBind)
            call.source = place.root.substr(place.root.find_first_not_of('/'));
        setOptions(call, place.options);
        all.calls.push_back(std::move(call));
    }
    return all;
}

int perform(const MountCalls& calls, std::size_t index) noexcept
{
    const FileDescriptor place = openToMountOn(calls.points, index);
    if (!place)
        return errno;
    const MountCall& call = calls.calls[index];
    return call.isBind ? bindPart(calls, call, place) : mountDevice(call, place);
}

bool isCovered(const Mount& place, const std::vector<Mount>& places)
{
    struct statx status = {};
    if (::statx(AT_FDCWD, place.target.c_str(), AT_NO_AUTOMOUNT, STATX_MNT_ID, &status) != 0 ||
        (status.stx_mask & STATX_MNT_ID) == 0)
        return false;
    const std::uint64_t shown = status.stx_mnt_id;
    return shown != 0 && std::none_of(places.begin(), places.end(), [shown](const auto& ours) {
               return ours.id == 0 || ours.id == shown;
           });
}

}  // namespace pellar
