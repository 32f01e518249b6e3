// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/Inspection.h"

#include "pellar/permissions/Capabilities.h"

#include <cerrno>

namespace pellar {
namespace {

Unseen unseenBecause(int error)
{
    switch (error) {
        case ENOENT:
        case ENOTDIR: return Unseen::Missing;
        case EXDEV: return Unseen::ElsewhereMounted;
        case ELOOP: return Unseen::BehindLink;
        default: return Unseen::Unreadable;
    }
}

}  // namespace

std::optional<Permissions> permissionsOf(int object, struct stat& status)
{
    if (::fstat(object, &status) != 0)
        return std::nullopt;
    Permissions permissions{
        kindOf(status.st_mode), status.st_mode & 07777U, status.st_uid, status.st_gid, {}};
    if (permissions.kind == FileKind::Regular) {
        auto capabilities = capabilitiesOf(object);
        if (!capabilities)
            return std::nullopt;
        permissions.capabilities = *std::move(capabilities);
    }
    return permissions;
}

std::variant<FoundFile, Unseen> inspect(const RootDirectory& root, const std::string& path)
{
    FileDescriptor object = root.openObject(path);
    if (!object)
        return unseenBecause(errno);
    struct stat status = {};
    auto permissions = permissionsOf(object.get(), status);
    if (!permissions)
        return Unseen::Unreadable;
    return FoundFile{std::move(object), *std::move(permissions), status};
}

}  // namespace pellar
