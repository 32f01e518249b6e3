// SPDX-License-Identifier: Apache-2.0
#include "pellar/partitions/MapDisk.h"

#include "pellar/probe/SignatureProbe.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>

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
PartitionMap readMapOf(int descriptor, const FileSectors& sectors, std::uint64_t offset,
                       std::uint64_t length)
{
    PartitionMap map = readPartitionMap(sectors, {});
    const bool isPlainMBR = map.kind == PartitionMap::Kind::MBR && map.boot.ordinaryCount() > 0;
    if (isPlainMBR || (map.boot.hasProtective() && map.hasCopiesInPlace()))
        return map;
    const Signature signature = probeSignature(descriptor, offset, length);
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

}  // namespace pellar
