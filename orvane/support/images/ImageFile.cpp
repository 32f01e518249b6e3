// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/images/ImageFile.h"

#include "pellar/partitions/MapDisk.h"
#include "pellar/partitions/MapReport.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <string>
#include <utility>

namespace orvane {
namespace {

// A hybrid optical image carries a partition map for memory sticks around one real file system.
bool isOpticalImage(const Superblock& superblock)
{
    return superblock.type == "iso9660" || superblock.type == "udf";
}

bool isTextByte(unsigned char byte)
{
    if (byte < 0x20)
        return byte == '\t' || byte == '\n' || byte == '\r' || byte == '\f';
    return byte != 0x7f && byte < 0xf5;  // UTF-8 ends there, and erased memory is 0xff
}

// Looked at in four places: a disk whose beginning a text was written over is still a disk.
bool isText(int descriptor, off_t length)
{
    constexpr off_t sampleBytes = 4096;
    std::array<unsigned char, sampleBytes> sample{};
    for (const off_t place :
         {off_t{0}, length / 3, length / 3 * 2, std::max(off_t{0}, length - sampleBytes)}) {
        const ssize_t got = ::pread(descriptor, sample.data(), sample.size(), place);
        if (got <= 0 || !std::all_of(sample.begin(), sample.begin() + got, isTextByte))
            return false;
    }
    return true;
}

bool isMapDamaged(const OpenImage& image)
{
    using pellar::MapVerdict;
    const auto sectors = pellar::sectorsOf(image.descriptor.get(), 0, image.length);
    const MapVerdict verdict =
        pellar::reportOn(pellar::readMapOf(image.descriptor.get(), sectors, 0, image.length))
            .verdict;
    return verdict == MapVerdict::Repairable || verdict == MapVerdict::NeedsPerson;
}

// A partition may claim more than the file has; what is there is still worth a look.
ByteRange withinFile(ByteRange range, std::uint64_t fileLength)
{
    if (range.offset >= fileLength)
        return {range.offset, 0};
    return {range.offset, std::min(range.length, fileLength - range.offset)};
}

ImageVolume readVolume(const OpenImage& image, Partition partition)
{
    const ByteRange there = withinFile(partition.range, image.length);
    ImageVolume volume;
    if (!partition.isContainer) {
        volume.superblock = readSuperblock(image.descriptor.get(), there);
        volume.hasExtBackup = hasExtBackupSuperblock(image.descriptor.get(), there);
        volume.space = pellar::spaceUseOf(image.descriptor.get(), there, volume.superblock.type);
    }
    volume.partition = std::move(partition);
    return volume;
}

}  // namespace

std::string ImageVolume::filesystem() const
{
    if (superblock.isFilesystem())
        return superblock.type;
    return superblock.type.empty() && hasExtBackup ? "ext4" : "";
}

Result<OpenImage, Failure> openImage(const std::filesystem::path& path,
                                     const Translator& translator)
{
    pellar::FileDescriptor descriptor(
        ::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC | O_NOCTTY));
    if (!descriptor)
        return Failure{errorText(errno)};
    struct stat status = {};
    if (::fstat(descriptor.get(), &status) != 0)
        return Failure{errorText(errno)};
    if (!S_ISREG(status.st_mode))
        return Failure{translator.text("it is not a regular file")};
    if (status.st_size == 0)
        return Failure{translator.text("the file is empty")};
    if (isText(descriptor.get(), status.st_size))
        return Failure{translator.text("it is a text file, not a disk image")};
    std::error_code error;
    const std::filesystem::path canonical = std::filesystem::canonical(path, error);
    if (error)
        return Failure{error.message()};
    return OpenImage{std::move(descriptor), canonical, static_cast<std::uint64_t>(status.st_size),
                     ::access(canonical.c_str(), W_OK) == 0};
}

ImageContents readContents(const OpenImage& image)
{
    Partition all;
    all.range = {0, image.length};
    ImageContents contents;
    contents.whole = readVolume(image, all);
    if (isOpticalImage(contents.whole.superblock))
        return contents;

    const auto table = readPartitionTable(image.descriptor.get());
    const bool isUnknown = contents.whole.filesystem().empty();
    contents.hasPartitionMap =
        (table && !isBootSector(image.descriptor.get(), *table, contents.whole.superblock)) ||
        (isUnknown && hasPartitionTableTraces(image.descriptor.get()));
    contents.isMapDamaged = contents.hasPartitionMap && isMapDamaged(image);
    contents.partitionMap = table ? table->type : "";
    for (const Partition& partition : table ? table->partitions : std::vector<Partition>())
        contents.partitions.push_back(readVolume(image, partition));
    return contents;
}

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
    facts.filesystemVersion = volume.superblock.version;
    facts.label = volume.superblock.label;
    facts.space = volume.space;
    if (volume.superblock.isFilesystem())
        facts.uuid = volume.superblock.uuid;
    facts.name = facts.label.empty() ? std::move(nameWithoutLabel) : facts.label;
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
    facts.name = image.path.filename();
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
    top.facts.name = image.path.filename();
    if (!contents.hasPartitionMap) {
        top.facts.type = diskType::bareVolume;
        addVolume(top.facts, contents.whole, image.path.filename());
        return top;
    }
    top.facts.type = diskType::whole;
    top.facts.isWhole = true;
    top.facts.partitionMap = contents.partitionMap;
    top.facts.hasDamagedMap = contents.isMapDamaged;
    for (const ImageVolume& volume : contents.partitions)
        top.children.push_back(partitionOf(image, volume));
    return top;
}

}  // namespace orvane
