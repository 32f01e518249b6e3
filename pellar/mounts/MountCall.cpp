// SPDX-License-Identifier: Apache-2.0
#include "pellar/mounts/MountCall.h"

#include <fcntl.h>
#include <libmount/libmount.h>
#include <sys/mount.h>
#include <sys/stat.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <climits>
#include <cstdlib>
#include <cstring>
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

void makeDirectories(const std::string& target) noexcept
{
    std::array<char, PATH_MAX> path;
    if (target.size() >= path.size())
        return;
    std::memcpy(path.data(), target.c_str(), target.size() + 1);
    for (std::size_t i = 1; i <= target.size(); ++i) {
        if (path[i] != '/' && path[i] != '\0')
            continue;
        const char end = std::exchange(path[i], '\0');
        ::mkdir(path.data(), 0755);
        path[i] = end;
    }
}

int call(const char* source, const MountCall& call, unsigned long flags, const char* data) noexcept
{
    return ::mount(source, call.target.c_str(), call.isBind ? nullptr : call.filesystem.c_str(),
                   flags, data) == 0
               ? 0
               : errno;
}

/// All zero when there is nothing.
struct statx statusOf(const std::string& path) noexcept
{
    struct statx status = {};
    if (::statx(AT_FDCWD, path.c_str(), AT_NO_AUTOMOUNT, STATX_MNT_ID, &status) != 0)
        status = {};
    return status;
}

/// Its number, as in /proc/self/mountinfo; 0 from a kernel before 5.8 (statx(2)).
std::uint64_t mountOf(const struct statx& status) noexcept
{
    return (status.stx_mask & STATX_MNT_ID) != 0 ? status.stx_mnt_id : 0;
}

}  // namespace

MountCall mountCallFor(const MountPlace& place, const std::string& wholeTarget)
{
    MountCall call{place.source,   place.target, place.filesystem, {}, 0,
                   place.isBind(), place.parent};
    if (call.isBind)
        call.source = wholeTarget + place.root;
    setOptions(call, place.options);
    return call;
}

int perform(const MountCall& mountCall) noexcept
{
    struct stat status = {};
    if (::stat(mountCall.target.c_str(), &status) != 0)
        makeDirectories(mountCall.target);
    if (!mountCall.isBind)
        return call(mountCall.source.c_str(), mountCall, mountCall.flags, mountCall.data.c_str());
    // A bind mount takes its own flags only in a second call (mount(2), "Creating a bind mount").
    if (const int error = call(mountCall.source.c_str(), mountCall, MS_BIND, nullptr))
        return error;
    return call(nullptr, mountCall, MS_BIND | MS_REMOUNT | mountCall.flags, nullptr);
}

bool isMounted(const MountCall& call) noexcept
{
    const struct statx status = statusOf(call.target);
    return (status.stx_attributes & STATX_ATTR_MOUNT_ROOT) != 0 &&
           (call.below == 0 || mountOf(status) != call.below);
}

bool isCovered(const MountPlace& place, const std::vector<MountPlace>& places)
{
    const std::uint64_t shown = mountOf(statusOf(place.target));
    return shown != 0 && std::none_of(places.begin(), places.end(), [shown](const auto& ours) {
               return ours.id == 0 || ours.id == shown;
           });
}

}  // namespace pellar
