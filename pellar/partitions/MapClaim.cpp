// SPDX-License-Identifier: Apache-2.0
#include "pellar/partitions/MapClaim.h"

#include "pellar/partitions/MapDisk.h"

#include <fcntl.h>
#include <linux/fs.h>
#include <sys/ioctl.h>
#include <sys/stat.h>

#include <cerrno>
#include <string>

namespace pellar {
namespace {

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

std::variant<MapClaim, contract::ErrorCode> MapClaim::take(const contract::DiskReference& disk,
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
    if (const auto* const error = std::get_if<contract::ErrorCode>(&taken))
        return *error;
    auto& claim = std::get<DiskClaim>(taken);
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

bool MapClaim::rereadPartitions() const
{
    // EINVAL: a device that takes no partitions of itself, as most loop devices.
    return !isBlockDevice(disk_.get()) || ::ioctl(disk_.get(), BLKRRPART) == 0 || errno == EINVAL;
}

}  // namespace pellar
