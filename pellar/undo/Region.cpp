// SPDX-License-Identifier: Apache-2.0
#include "pellar/undo/Region.h"

#include <fcntl.h>
#include <linux/fs.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <cerrno>

namespace pellar {

int FileRegion::read(std::uint64_t place, std::span<std::uint8_t> bytes)
{
    return holds(place, bytes.size()) ? readAll(descriptor_, offset_ + place, bytes) : EFBIG;
}

int FileRegion::write(std::uint64_t place, ByteView bytes)
{
    return holds(place, bytes.size()) ? writeAll(descriptor_, offset_ + place, bytes) : EFBIG;
}

int FileRegion::sync()
{
    return ::fsync(descriptor_) == 0 ? 0 : errno;
}

void FileRegion::forgetCached()
{
    // ENOTTY from a regular file, EACCES without root's rights: the advice below remains.
    ::ioctl(descriptor_, BLKFLSBUF, 0);
    ::posix_fadvise(descriptor_, static_cast<off_t>(offset_), static_cast<off_t>(length_),
                    POSIX_FADV_DONTNEED);
}

}  // namespace pellar
