// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/DiskLookup.h"

#include "contract/foundation/UTF8.h"
#include "orvane/support/images/ImageFile.h"

#include <sys/stat.h>

#include <cerrno>
#include <vector>

namespace orvane {

namespace fs = std::filesystem;

Result<std::shared_ptr<Disk>, Failure> DiskLookup::find(std::string_view name)
{
    if (name.empty())
        return cannotUse(name, translator_.text("it has no name"));
    if (auto known = controller_.diskNamed(name))
        return known;
    for (const std::string_view tag : {"LABEL=", "UUID="})
        if (name.starts_with(tag))
            return findByTag(tag, name.substr(tag.size()));
    return findFile(fs::path(name));
}

Failure DiskLookup::cannotUse(std::string_view object, std::string_view reason) const
{
    return {translator_.sentence("cannot use ‘%@’: %@", {contract::printable(object), reason})};
}

Result<std::shared_ptr<Disk>, Failure> DiskLookup::findByTag(std::string_view tag,
                                                             std::string_view value)
{
    const bool isLabel = tag == "LABEL=";
    std::vector<std::shared_ptr<Disk>> meant;
    for (const auto& root : controller_.roots())
        for (const auto& disk : withParts(root))
            if (!value.empty() && (isLabel ? disk->facts().label : disk->facts().uuid) == value)
                meant.push_back(disk);
    const std::string name = std::string(tag) + std::string(value);
    if (meant.empty())
        return cannotUse(
            name, translator_.text(isLabel ? "no disk has this label" : "no disk has this UUID"));
    if (meant.size() > 1)
        return cannotUse(
            name, translator_.sentence("%@ and %@ both have it", {meant[0]->facts().identifier,
                                                                  meant[1]->facts().identifier}));
    return meant.front();
}

Result<std::shared_ptr<Disk>, Failure> DiskLookup::findFile(const fs::path& path)
{
    struct stat status = {};
    if (::stat(path.c_str(), &status) != 0)
        return cannotUse(path.native(), errorText(errno));
    switch (status.st_mode & S_IFMT) {
        case S_IFREG: return findImage(path);
        case S_IFBLK: return findDevice(path);
        case S_IFDIR: return findMountPoint(path);
        default:
            return cannotUse(path.native(),
                             translator_.text("it is neither a disk nor a disk image"));
    }
}

Result<std::shared_ptr<Disk>, Failure> DiskLookup::findDevice(const fs::path& path)
{
    std::error_code error;
    const fs::path node = fs::canonical(path, error);
    if (error)
        return cannotUse(path.native(), error.message());
    if (auto known = controller_.diskNamed(node.native()))
        return known;
    const auto facts = readBlockDevice(node, DiskSources());
    if (!facts || facts->length == 0)
        return cannotUse(path.native(), translator_.text("there is no medium in it"));
    return controller_.add(*facts);
}

Result<std::shared_ptr<Disk>, Failure> DiskLookup::findMountPoint(const fs::path& path)
{
    std::error_code error;
    const fs::path directory = fs::canonical(path, error);
    if (error)
        return cannotUse(path.native(), error.message());
    const auto volume = controller_.find(
        [&](const Disk& disk) { return disk.facts().mountPoint == directory.native(); });
    if (volume)
        return volume;
    const auto mount = pellar::mountHolding(pellar::currentMounts(), directory);
    const bool isMountPoint = mount && mount->target == directory.native();
    return cannotUse(path.native(),
                     translator_.text(isMountPoint ? "no disk is mounted on this directory"
                                                   : "this directory is no mount point"));
}

Result<std::shared_ptr<Disk>, Failure> DiskLookup::findImage(const fs::path& path)
{
    auto opened = openImage(path, translator_);
    if (!opened)
        return cannotUse(path.native(), opened.error().message);
    return controller_.add(factsOfImage(*opened));
}

}  // namespace orvane
