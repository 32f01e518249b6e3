// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/TakingBack.h"

#include <algorithm>
#include <array>

namespace pellar {
namespace {

// The number of a device changes with where it is connected, so the root's stands for itself.
bool isSameObject(const RootDirectory& root, std::uint64_t recordedRoot,
                  const RecordedChange& change, const FoundFile& file)
{
    const std::uint64_t device = change.device == recordedRoot ? deviceOf(root) : change.device;
    return file.status.st_dev == device && file.status.st_ino == change.inode &&
           file.permissions.kind == change.before.permissions.kind;
}

/// chown(2) takes setuid, setgid and the capabilities away, and what is to lend rights is harmless
/// for a while.
bool isModeBetween(mode_t mode, mode_t from, mode_t to)
{
    const auto isReachedFrom = [mode](mode_t one) {
        const std::array<mode_t, 4> reached{one, one & ~mode_t{S_ISUID},
                                            one & ~mode_t{S_ISUID | S_ISGID}, one & mode_t{0755}};
        return std::ranges::find(reached, mode) != reached.end();
    };
    return isReachedFrom(from) || isReachedFrom(to);
}

bool isBetween(const Permissions& is, const Permissions& from, const Permissions& to)
{
    const auto hasOwnerOf = [&is](const Permissions& other) {
        return is.user == other.user && is.group == other.group;
    };
    return (hasOwnerOf(from) || hasOwnerOf(to)) && isModeBetween(is.mode, from.mode, to.mode) &&
           (is.capabilities.empty() || is.capabilities == from.capabilities ||
            is.capabilities == to.capabilities);
}

bool isAsLeft(const RecordedChange& change, const FileState& now)
{
    // What a directory holds may come and go, and that changes both of its times.
    const bool isDirectory = now.permissions.kind == FileKind::Directory;
    if (change.stage == ChangeStage::Changed && change.after)
        return now == *change.after || (isDirectory && now.modified != change.after->modified &&
                                        now.permissions == change.after->permissions);
    if (!isDirectory && now.modified != change.before.modified)
        return false;
    return isBetween(now.permissions, change.before.permissions,
                     change.after ? change.after->permissions : change.wanted);
}

Reference referenceFor(const RecordedChange& change)
{
    const Permissions& before = change.before.permissions;
    Reference reference;
    reference.path = change.path;
    reference.kind = before.kind;
    reference.mode = before.mode;
    reference.user = before.user;
    reference.group = before.group;
    reference.capabilities = before.capabilities;
    reference.digest = change.digest;
    return reference;
}

}  // namespace

TakingBack takeBack(const RootDirectory& root, std::uint64_t recordedRoot,
                    const RecordedChange& change)
{
    const auto file = inspect(root, change.path);
    if (!file)
        return file.error();
    if (!isSameObject(root, recordedRoot, change, *file))
        return ChangedSince{};
    if (file->permissions == change.before.permissions)
        return AsBefore{};
    if (!isAsLeft(change, stateOf(file->permissions, file->status)))
        return ChangedSince{};
    if (lendsRights(change.before.permissions) && change.digest.empty())
        return ContentsNotKnown{};
    const Restoring given = give(referenceFor(change), *file);
    if (const auto* const refusal = std::get_if<NotPermitted>(&given))
        return *refusal;
    if (!std::holds_alternative<Restored>(given))
        return ChangedSince{};
    return PutBack{};
}

std::uint64_t deviceOf(const RootDirectory& root)
{
    const FileDescriptor directory = root.openObject(".");
    struct stat status = {};
    return directory && ::fstat(directory.get(), &status) == 0 ? status.st_dev : 0;
}

}  // namespace pellar
