// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/Inspection.h"

#include "pellar/permissions/Capabilities.h"
#include "pellar/permissions/Digest.h"

#include <fcntl.h>

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

Contents contentsOf(const FoundFile& file, const Reference& reference)
{
    constexpr std::uint64_t largest = 256U << 20U;
    const auto kind = kindOfDigest(reference.digest);
    if (!kind || file.permissions.kind != FileKind::Regular)
        return Contents::NotKnown;
    const FileDescriptor readable(
        ::open(pathOfDescriptor(file.object.get()).c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC));
    const auto digest =
        readable ? digestOfFile(readable.get(), *kind, largest) : std::optional<std::string>();
    if (!digest)
        return Contents::NotKnown;
    return *digest == reference.digest ? Contents::AsPackaged : Contents::NotAsPackaged;
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
