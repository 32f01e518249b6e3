// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/Inspection.h"

#include "contract/foundation/Format.h"
#include "contract/foundation/UTF8.h"
#include "pellar/bytes/Digest.h"
#include "pellar/packages/Permissions.h"

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

std::string_view textOf(FileKind kind)
{
    switch (kind) {
        case FileKind::Regular: return "a regular file";
        case FileKind::Directory: return "a directory";
        case FileKind::SymbolicLink: return "a symbolic link";
        case FileKind::Other: break;
    }
    return "a special file";
}

// "1000 (alice)", or the number alone when nobody has it.
std::string accountText(std::uint32_t number, const std::string& name)
{
    const std::string text = std::to_string(number);
    return name.empty() ? text : text + " (" + contract::printable(name) + ")";
}

std::string capabilityText(const std::string& capabilities, const Texts& texts)
{
    return capabilities.empty() ? texts.text("none") : capabilities;
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

Result<FoundFile, Unseen> inspect(const RootDirectory& root, const std::string& path)
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

Difference compare(const Reference& should, const Permissions& is)
{
    if (should.kind && *should.kind != is.kind)
        return {true, false, false, false, false};
    Difference difference;
    difference.mode = is.kind != FileKind::SymbolicLink && should.mode != is.mode;
    difference.user = should.user != is.user;
    difference.group = should.group != is.group;
    difference.capabilities = is.kind == FileKind::Regular && should.capabilities &&
                              *should.capabilities != is.capabilities;
    return difference;
}

std::vector<std::string> linesOf(const Difference& difference, const Reference& should,
                                 const Permissions& is, const Accounts& accounts,
                                 const Texts& texts)
{
    std::vector<std::string> lines;
    const auto add = [&](std::string_view key, const std::string& found,
                         const std::string& wanted) {
        lines.push_back(
            contract::format(texts.text(key), {contract::printable(should.path), found, wanted}));
    };
    if (difference.kind)
        add("“%1$@” is %2$@, should be %3$@; it was not compared.", texts.text(textOf(is.kind)),
            texts.text(textOf(*should.kind)));
    if (difference.mode)
        add("Permissions differ on “%1$@”: they are %2$@, should be %3$@.",
            modeText(is.kind, is.mode), modeText(is.kind, should.mode));
    if (difference.user)
        add("Owner differs on “%1$@”: it is %2$@, should be %3$@.",
            accountText(is.user, accounts.users.nameOf(is.user)),
            accountText(should.user, accounts.users.nameOf(should.user)));
    if (difference.group)
        add("Group differs on “%1$@”: it is %2$@, should be %3$@.",
            accountText(is.group, accounts.groups.nameOf(is.group)),
            accountText(should.group, accounts.groups.nameOf(should.group)));
    if (difference.capabilities)
        add("Capabilities differ on “%1$@”: they are %2$@, should be %3$@.",
            capabilityText(is.capabilities, texts), capabilityText(*should.capabilities, texts));
    return lines;
}

}  // namespace pellar
