// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/Restoring.h"

#include "pellar/packages/Permissions.h"
#include "pellar/permissions/Inspection.h"
#include "pellar/process/FileDescriptor.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <optional>

namespace pellar {
namespace {

// Its own name is looked up again: the object must still be the one behind it.
bool isAsSeen(const RootDirectory& root, const Reference& reference, const FoundFile& seen)
{
    const FileDescriptor again = root.openObject(reference.path);
    struct stat status = {};
    return again && ::fstat(again.get(), &status) == 0 && status.st_dev == seen.status.st_dev &&
           status.st_ino == seen.status.st_ino && status.st_mode == seen.status.st_mode &&
           status.st_uid == seen.status.st_uid && status.st_gid == seen.status.st_gid &&
           status.st_ctim.tv_sec == seen.status.st_ctim.tv_sec &&
           status.st_ctim.tv_nsec == seen.status.st_ctim.tv_nsec;
}

bool isClosedToOthers(const RootDirectory& root, const std::string& path)
{
    const std::size_t slash = path.rfind('/');
    const FileDescriptor parent =
        root.openObject(slash == std::string::npos ? std::string(".") : path.substr(0, slash));
    struct stat status = {};
    return parent && ::fstat(parent.get(), &status) == 0 && status.st_uid == 0 &&
           (status.st_mode & (S_IWGRP | S_IWOTH)) == 0;
}

int setOwner(const Reference& reference, int object)
{
    return ::fchownat(object, "", reference.user, reference.group, AT_EMPTY_PATH) == 0 ? 0 : errno;
}

int setMode(const Reference& reference, int object)
{
    return ::chmod(pathOfDescriptor(object).c_str(), reference.mode) == 0 ? 0 : errno;
}

int setAll(const Reference& reference, const Permissions& is, int object)
{
    const Difference difference = compare(reference, is);
    const bool changesOwner = difference.user || difference.group;
    int error = changesOwner ? setOwner(reference, object) : 0;
    const bool hasMode = is.kind != FileKind::SymbolicLink;
    if (error == 0 && hasMode && (changesOwner || difference.mode))
        error = setMode(reference, object);
    const bool wantsCapabilities = reference.capabilities && !reference.capabilities->empty();
    if (error == 0 && (difference.capabilities || (changesOwner && wantsCapabilities)))
        error = setCapabilities(object, *reference.capabilities);
    return error;
}

// A lease is refused while somebody has the file open for writing (fcntl(2)); where a file system
// knows none, the kernel still takes setuid away when another writes. SIGURG, which would tell of
// the next to open it, is ignored by default.
bool isOpenForWriting(int object)
{
    const FileDescriptor readable(
        ::open(pathOfDescriptor(object).c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC));
    ::fcntl(readable.get(), F_SETSIG, SIGURG);
    return readable && ::fcntl(readable.get(), F_SETLEASE, F_RDLCK) != 0 && errno == EAGAIN;
}

/// Makes the file one that nobody but its rightful owner can write to, without lending any right
/// yet, and looks at its contents then. None when they are the package's.
std::optional<Restoring> objectionToLending(const Reference& reference, const FoundFile& seen)
{
    if (contentsOf(seen, reference) != Contents::AsPackaged)
        return ForeignContents{};
    const int object = seen.object.get();
    int error = setOwner(reference, object);
    constexpr mode_t harmless = 0755;
    if (error == 0)
        error =
            ::chmod(pathOfDescriptor(object).c_str(), reference.mode & harmless) == 0 ? 0 : errno;
    if (error != 0)
        return NotPermitted{error};
    if (isOpenForWriting(object))
        return ChangedMeanwhile{.wasTouched = true};
    if (contentsOf(seen, reference) != Contents::AsPackaged)
        return ForeignContents{.wasTouched = true};
    return std::nullopt;
}

}  // namespace

Restoring restore(const RootDirectory& root, const Reference& reference, const FoundFile& seen)
{
    if ((reference.kind && *reference.kind != seen.permissions.kind) ||
        !isAsSeen(root, reference, seen))
        return ChangedMeanwhile{};
    const bool hasFurtherNames =
        seen.permissions.kind == FileKind::Regular && seen.status.st_nlink > 1;
    if (hasFurtherNames && !isClosedToOthers(root, reference.path))
        return SuspiciousLink{};
    return give(reference, seen);
}

Restoring give(const Reference& reference, const FoundFile& seen)
{
    const bool lends = seen.permissions.kind == FileKind::Regular && lendsRights(reference);
    if (const auto objection = lends ? objectionToLending(reference, seen) : std::nullopt)
        return *objection;
    struct stat status = {};
    const auto before = permissionsOf(seen.object.get(), status);
    if (const int error = before ? setAll(reference, *before, seen.object.get()) : EIO)
        return NotPermitted{error};
    const auto now = permissionsOf(seen.object.get(), status);
    if (!now || !compare(reference, *now).isNone())
        return NotPermitted{EIO};  // the file system took the order and did not carry it out
    return Restored{};
}

}  // namespace pellar
