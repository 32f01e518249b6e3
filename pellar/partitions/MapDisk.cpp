// SPDX-License-Identifier: Apache-2.0
#include "pellar/partitions/MapDisk.h"

#include "pellar/probe/DiskProbe.h"

#include <fcntl.h>
#include <linux/fs.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <string>

namespace pellar {
namespace {

constexpr std::uint32_t usualSectorBytes = 512;
constexpr std::uint32_t largeSectorBytes = 4096;

bool isSectorSize(std::uint32_t bytes)
{
    return bytes == usualSectorBytes || bytes == largeSectorBytes;
}

/// A pipe or a terminal in a disk's place is none.
bool isDisk(int descriptor)
{
    struct stat status = {};
    return ::fstat(descriptor, &status) == 0 &&
           (S_ISBLK(status.st_mode) || S_ISREG(status.st_mode));
}

bool isBlockDevice(int descriptor)
{
    struct stat status = {};
    return ::fstat(descriptor, &status) == 0 && S_ISBLK(status.st_mode);
}

/// The claimed disk itself, opened once more, so that it cannot be another one by now. A device is
/// held exclusively: the kernel refuses that while a part of it is mounted or otherwise in use.
FileDescriptor openClaimed(const DiskClaim& claim)
{
    const std::string name = pathOfDescriptor(claim.descriptor());
    const int exclusive = isBlockDevice(claim.descriptor()) ? O_EXCL : 0;
    return FileDescriptor(::open(name.c_str(), O_RDWR | O_CLOEXEC | exclusive));
}

}  // namespace

FileDescriptor openDiskForReading(const contract::DiskReference& disk)
{
    FileDescriptor opened(::open(disk.path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC | O_NOCTTY));
    return opened && isDisk(opened.get()) ? std::move(opened) : FileDescriptor();
}

std::uint64_t lengthOfDisk(int descriptor, const contract::DiskReference& disk)
{
    const off_t end = ::lseek(descriptor, 0, SEEK_END);
    const std::uint64_t size = end < 0 ? 0 : static_cast<std::uint64_t>(end);
    const std::uint64_t rest = size > disk.offset ? size - disk.offset : 0;
    return disk.length == 0 ? rest : std::min(rest, disk.length);
}

FileSectors sectorsOf(int descriptor, std::uint64_t offset, std::uint64_t length)
{
    const auto device = deviceSectorBytes(descriptor);
    if (device && isSectorSize(*device))
        return {descriptor, offset, length, *device};
    const FileSectors usual(descriptor, offset, length, usualSectorBytes);
    const FileSectors large(descriptor, offset, length, largeSectorBytes);
    return !hasGPTHeader(usual) && hasGPTHeader(large) ? large : usual;
}

// What fills the disk matters only where the map is not plainly in force, and takes longer to find.
PartitionMap readMapOf(int descriptor, const Sectors& sectors, std::uint64_t offset,
                       std::uint64_t length)
{
    PartitionMap map = readPartitionMap(sectors, {});
    const bool isPlainMBR = map.kind == PartitionMap::Kind::MBR && map.boot.ordinaryCount() > 0;
    if (isPlainMBR || (map.boot.hasProtective() && map.hasCopiesInPlace()))
        return map;
    const Superblock signature = readSuperblock(descriptor, {offset, length});
    return readPartitionMap(sectors, signature.isAmbivalent ? "?" : signature.type);
}

PartitionMap glanceAtMap(const contract::DiskReference& disk)
{
    const FileDescriptor opened = openDiskForReading(disk);
    if (!opened)
        return {};
    const std::uint64_t length = lengthOfDisk(opened.get(), disk);
    return readMapOf(opened.get(), sectorsOf(opened.get(), disk.offset, length), disk.offset,
                     length);
}

Result<MapClaim, contract::ErrorCode> MapClaim::take(const contract::DiskReference& disk,
                                                     Access access, const SystemPaths& paths)
{
    if (access == Access::ReadOnly) {
        auto opened = openDiskForReading(disk);
        if (!opened)
            return contract::kPLErrorCannotOpen;
        const std::uint64_t length = lengthOfDisk(opened.get(), disk);
        return MapClaim(std::move(opened), std::nullopt, disk.offset, length);
    }
    auto taken = DiskClaim::take(disk, access, paths);
    if (!taken)
        return taken.error();
    auto& claim = *taken;
    FileDescriptor opened = openClaimed(claim);
    if (!opened)
        return errno == EBUSY ? contract::kPLErrorDiskInUse : contract::kPLErrorCannotOpen;
    const std::uint64_t length = claim.availableBytes();
    return MapClaim(std::move(opened), std::move(claim), disk.offset, length);
}

FileSectors MapClaim::sectors() const
{
    return sectorsOf(disk_.get(), offset_, length_);
}

PartitionMap MapClaim::readMap() const
{
    return readMapOf(disk_.get(), sectors(), offset_, length_);
}

PartitionMap MapClaim::readMap(const RepairPlan& plan) const
{
    const FileSectors disk = sectors();
    return readMapOf(disk_.get(), PlannedSectors(disk, plan), offset_, length_);
}

bool MapClaim::rereadPartitions() const
{
    // EINVAL: a device that takes no partitions of itself, as most loop devices.
    return !isBlockDevice(disk_.get()) || ::ioctl(disk_.get(), BLKRRPART) == 0 || errno == EINVAL;
}

}  // namespace pellar
