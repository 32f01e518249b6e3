// SPDX-License-Identifier: Apache-2.0
#include "pellar/mounts/MountCall.h"

#include <fcntl.h>
#include <libmount/libmount.h>
#include <sys/mount.h>
#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <memory>
#include <utility>

namespace pellar {
namespace {

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
