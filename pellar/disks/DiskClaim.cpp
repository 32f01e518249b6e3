// SPDX-License-Identifier: Apache-2.0
#include "pellar/disks/DiskClaim.h"

#include "pellar/mounts/MountTable.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <thread>

namespace pellar {
namespace {

using namespace std::chrono_literals;
using contract::ErrorCode;

// O_NONBLOCK: opening a FIFO in a disk's place must not wait for its other end. It has no effect
// on regular files and block devices (open(2)).
FileDescriptor openDisk(const contract::DiskReference& disk, int mode)
{
    return FileDescriptor(::open(disk.path.c_str(), mode | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
}

ErrorCode openError(const contract::DiskReference& disk, Access access, int error)
{
    if (error == EBUSY || error == ETXTBSY)
        return contract::kPLErrorDiskInUse;
    const bool isRefused = error == EACCES || error == EPERM || error == EROFS;
    if (access == Access::ReadWrite && isRefused && openDisk(disk, O_RDONLY))
        return contract::kPLErrorReadOnly;
    return contract::kPLErrorCannotOpen;
}

/// A device that a mount, a swap area, a RAID or a mapping holds refuses to be opened
/// exclusively (open(2), O_EXCL on block devices). Only asked: the tool wants it for itself.
bool isHeldByKernel(const contract::DiskReference& disk)
{
    return !openDisk(disk, O_RDONLY | O_EXCL) && errno == EBUSY;
}

ErrorCode useError(const contract::DiskReference& disk, const struct stat& status,
                   const SystemPaths& paths)
{
    // A file that took a device's name is no disk that was meant.
    if (S_ISREG(status.st_mode) && disk.storage == contract::DiskReference::Storage::BlockDevice)
        return contract::kPLErrorCannotOpen;
    if (S_ISREG(status.st_mode))
        return loopDeviceOn(status.st_dev, status.st_ino, paths).empty()
                   ? contract::kPLNoError
                   : contract::kPLErrorDiskInUse;
    if (!S_ISBLK(status.st_mode))
        return contract::kPLErrorCannotOpen;
    if (isMounted(status.st_rdev, paths))
        return contract::kPLErrorCouldNotUnmount;
    return isHeldByKernel(disk) ? contract::kPLErrorDiskInUse : contract::kPLNoError;
}

/// NO when somebody else has it. Some network file systems know no locks; that is no reason to
/// leave a disk unchecked.
bool lock(int descriptor, Access access)
{
    const int kind = access == Access::ReadOnly ? LOCK_SH : LOCK_EX;
    return ::flock(descriptor, kind | LOCK_NB) == 0 || errno != EWOULDBLOCK;
}

/// Bytes, of a device as well: its end can be sought, its st_size is 0.
std::uint64_t sizeOf(int descriptor)
{
    const off_t end = ::lseek(descriptor, 0, SEEK_END);
    return end < 0 ? 0 : static_cast<std::uint64_t>(end);
}

}  // namespace

std::variant<DiskClaim, ErrorCode, DiskClaim::Locked> DiskClaim::attempt(
    const contract::DiskReference& disk, Access access, const SystemPaths& paths)
{
    FileDescriptor opened = openDisk(disk, access == Access::ReadOnly ? O_RDONLY : O_RDWR);
    if (!opened)
        return openError(disk, access, errno);
    struct stat status = {};
    if (::fstat(opened.get(), &status) != 0)
        return contract::kPLErrorCannotOpen;
    if (const ErrorCode error = useError(disk, status, paths))
        return error;
    if (!lock(opened.get(), access)) {
        if (S_ISBLK(status.st_mode))
            return Locked{};
        return contract::kPLErrorDiskInUse;
    }
    // Whoever attaches an image holds the lock until it is attached, which may just have been.
    if (const ErrorCode error = useError(disk, status, paths))
        return error;
    return DiskClaim(std::move(opened), disk.path, disk.offset, disk.length);
}

Result<DiskClaim, ErrorCode> DiskClaim::take(const contract::DiskReference& disk, Access access,
                                             const SystemPaths& paths)
{
    constexpr int attempts = 50;
    for (int i = 0; i < attempts; ++i) {
        auto claim = attempt(disk, access, paths);
        if (auto* const taken = std::get_if<DiskClaim>(&claim))
            return std::move(*taken);
        if (const auto* const error = std::get_if<ErrorCode>(&claim))
            return *error;
        std::this_thread::sleep_for(20ms);
    }
    return contract::kPLErrorDiskInUse;
}

DiskClaim::DiskClaim(FileDescriptor disk, std::filesystem::path path, std::uint64_t offset,
                     std::uint64_t length)
    : disk_(std::move(disk)), path_(std::move(path)), offset_(offset)
{
    const std::uint64_t size = sizeOf(disk_.get());
    const std::uint64_t rest = size > offset ? size - offset : 0;
    availableBytes_ = length == 0 ? rest : std::min(rest, length);
    isAllOfIt_ = offset == 0 && availableBytes_ == size;
}

bool DiskClaim::isBlockDevice() const
{
    struct stat status = {};
    return ::fstat(disk_.get(), &status) == 0 && S_ISBLK(status.st_mode);
}

bool DiskClaim::isStillInPlace() const
{
    struct stat claimed = {};
    struct stat named = {};
    if (::fstat(disk_.get(), &claimed) != 0 || ::stat(path_.c_str(), &named) != 0)
        return false;
    if (S_ISBLK(claimed.st_mode))
        return S_ISBLK(named.st_mode) && named.st_rdev == claimed.st_rdev;
    return named.st_dev == claimed.st_dev && named.st_ino == claimed.st_ino;
}

bool DiskClaim::isStillWhole() const
{
    return sizeOf(disk_.get()) >= offset_ + availableBytes_;
}

bool DiskClaim::isEndReadable() const
{
    const std::uint64_t end = offset_ + availableBytes_;
    char last = 0;
    return availableBytes_ == 0 || ::pread(disk_.get(), &last, 1, static_cast<off_t>(end - 1)) == 1;
}

Result<DiskForTool, int> DiskForTool::prepare(const DiskClaim& claim, Form form, Access access)
{
    const bool isFit = form == Form::Itself || (form == Form::VolumeAlone && claim.isAllOfIt()) ||
                       (claim.isAllOfIt() && claim.isBlockDevice());
    if (isFit)
        return DiskForTool(claim.descriptor(), claim.offset());
    return onLoop(claim.descriptor(), claim.offset(), claim.availableBytes(), access);
}

Result<DiskForTool, int> DiskForTool::prepare(int file, std::uint64_t bytes, Form form,
                                              Access access)
{
    if (form == Form::BlockDevice)
        return onLoop(file, 0, bytes, access);
    return DiskForTool(file, 0);
}

Result<DiskForTool, int> DiskForTool::onLoop(int file, std::uint64_t offset, std::uint64_t bytes,
                                             Access access)
{
    auto loop = LoopDevice::attach(file, offset, bytes, access);
    if (!loop)
        return loop.error();
    DiskForTool disk(file, 0);
    disk.loop_.emplace(*std::move(loop));
    return disk;
}

}  // namespace pellar
