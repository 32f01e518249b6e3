// SPDX-License-Identifier: Apache-2.0
#include "pellar/process/TrustedPath.h"

#include "contract/foundation/UTF8.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <utility>

namespace pellar {
namespace {

using Opened = Result<FileDescriptor, std::string>;

bool isProgramOwner(uid_t owner)
{
    struct stat status = {};
    return ::stat("/proc/self/exe", &status) == 0 && status.st_uid == owner;
}

bool isTrustedOwner(uid_t owner)
{
    return owner == 0 || owner == ::geteuid() || isProgramOwner(owner);
}

// A group that only the user is in is the user; which groups are like that cannot be told, so of
// the groups only root's and the process's own are trusted.
bool isTrustedGroup(gid_t group)
{
    return group == 0 || group == ::getegid();
}

// What lies in a directory with this bit is renamed and removed by its owner alone.
bool isSticky(const struct stat& status)
{
    return S_ISDIR(status.st_mode) && (status.st_mode & S_ISVTX) != 0 &&
           isTrustedOwner(status.st_uid);
}

Opened openChecked(int directory, const std::filesystem::path& name,
                   const std::filesystem::path& shown, bool isOnWay)
{
    FileDescriptor opened(::openat(directory, name.c_str(), O_PATH | O_NOFOLLOW | O_CLOEXEC));
    struct stat status = {};
    if (!opened || ::fstat(opened.get(), &status) != 0)
        return std::string(::strerrordesc_np(errno));
    if (isOnWay && isSticky(status))
        return opened;
    const std::string reason = whyOthersCanChange(status);
    if (reason.empty())
        return opened;
    return isOnWay ? "“" + contract::printable(shown.native()) + "”, on the way there: " + reason
                   : reason;
}

}  // namespace

std::string whyOthersCanChange(const struct stat& status)
{
    if (!isTrustedOwner(status.st_uid))
        return "it belongs to another user (number " + std::to_string(status.st_uid) + ")";
    const bool othersMayWrite = (status.st_mode & S_IWOTH) != 0 ||
                                ((status.st_mode & S_IWGRP) != 0 && !isTrustedGroup(status.st_gid));
    return othersMayWrite ? "other users may change it" : "";
}

Result<FileDescriptor, std::string> openTrusted(const std::filesystem::path& path)
{
    std::error_code error;
    const std::filesystem::path canonical = std::filesystem::canonical(path, error);
    if (error)
        return std::string(::strerrordesc_np(error.value()));
    if (::geteuid() != 0)
        return openChecked(AT_FDCWD, canonical, canonical, false);
    Opened opened = openChecked(AT_FDCWD, "/", "/", canonical.relative_path() != "");
    std::filesystem::path way = "/";
    for (const std::filesystem::path& name : canonical.relative_path()) {
        if (!opened)
            return opened;
        way /= name;
        opened = openChecked(opened->get(), name, way, way != canonical);
    }
    return opened;
}

}  // namespace pellar
