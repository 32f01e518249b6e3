// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/images/ImageDisks.h"

#include <string>

namespace orvane {
namespace {

std::string numbered(const std::filesystem::path& path, int number)
{
    return path.native() + "#" + std::to_string(number);
}

DiskFacts partOfImage(const OpenImage& image, const ImageVolume& volume)
{
    const int number = volume.partition.number;
    DiskFacts facts;
    facts.identifier = numbered(image.path, number);
    facts.number = number;
    facts.storage = contract::DiskReference::Storage::FileRegion;
    facts.path = image.path;
    facts.offset = volume.partition.range.offset;
    facts.length = volume.partition.range.length;
    facts.isWritable = image.isWritable;
    return facts;
}

void addVolume(DiskFacts& facts, const ImageVolume& volume, std::string nameWithoutLabel)
{
    facts.filesystem = volume.filesystem();
    facts.label = volume.superblock.label;
    if (volume.superblock.isFilesystem())
        facts.uuid = volume.superblock.uuid;
    facts.displayName = facts.label.empty() ? std::move(nameWithoutLabel) : facts.label;
}

DiskTree partitionOf(const OpenImage& image, const ImageVolume& volume)
{
    DiskFacts facts = partOfImage(image, volume);
    facts.type = volume.partition.isContainer ? diskType::container : diskType::volume;
    addVolume(facts, volume, numbered(image.path.filename(), volume.partition.number));
    // What another kind of superblock has claimed (swap, RAID) is no damaged file system.
    const bool mayBeDamaged =
        volume.superblock.type.empty() && announcesFilesystem(volume.partition);
    facts.isShown = !volume.partition.isContainer && (!facts.filesystem.empty() || mayBeDamaged);
    return {facts, {}};
}

}  // namespace

DiskFacts factsOfImage(const OpenImage& image)
{
    DiskFacts facts;
    facts.identifier = image.path.native();
    facts.displayName = image.path.filename();
    facts.type = diskType::diskImage;
    facts.storage = contract::DiskReference::Storage::FileRegion;
    facts.path = image.path;
    facts.length = image.length;
    facts.isWritable = image.isWritable;
    facts.imagePath = image.path;
    return facts;
}

DiskTree disksOfImage(const OpenImage& image, const ImageContents& contents)
{
    DiskTree top{partOfImage(image, contents.whole), {}};
    top.facts.displayName = image.path.filename();
    if (!contents.hasPartitionMap) {
        top.facts.type = diskType::bareVolume;
        addVolume(top.facts, contents.whole, image.path.filename());
        return top;
    }
    top.facts.type = diskType::whole;
    top.facts.isWhole = true;
    top.facts.hasDamagedMap = contents.isMapDamaged;
    for (const ImageVolume& volume : contents.partitions)
        top.children.push_back(partitionOf(image, volume));
    return top;
}

}  // namespace orvane
