// SPDX-License-Identifier: Apache-2.0
#include "pellar/partitions/Sectors.h"

#include <fcntl.h>
#include <linux/fs.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>

namespace pellar {

std::optional<Bytes> FileSectors::read(std::uint64_t first, std::uint64_t number) const
{
    if (!isOnDisk(first, number, count_))
        return std::nullopt;
    Bytes bytes(number * sectorBytes_);
    for (std::size_t done = 0; done < bytes.size();) {
        const ssize_t count = ::pread(descriptor_, bytes.data() + done, bytes.size() - done,
                                      static_cast<off_t>(offset_ + first * sectorBytes_ + done));
        if (count < 0 && errno == EINTR)
            continue;
        if (count <= 0)
            return std::nullopt;
        done += static_cast<std::size_t>(count);
    }
    return bytes;
}

int FileSectors::write(std::uint64_t first, ByteView bytes) const
{
    if (bytes.size() % sectorBytes_ != 0 || !isOnDisk(first, bytes.size() / sectorBytes_, count_))
        return EFBIG;
    for (std::size_t done = 0; done < bytes.size();) {
        const ssize_t count = ::pwrite(descriptor_, bytes.data() + done, bytes.size() - done,
                                       static_cast<off_t>(offset_ + first * sectorBytes_ + done));
        if (count < 0 && errno == EINTR)
            continue;
        if (count <= 0)
            return count == 0 ? EIO : errno;
        done += static_cast<std::size_t>(count);
    }
    return ::fsync(descriptor_) == 0 ? 0 : errno;
}

void FileSectors::forgetCached() const
{
    ::posix_fadvise(descriptor_, 0, 0, POSIX_FADV_DONTNEED);
}

std::optional<std::uint32_t> deviceSectorBytes(int descriptor)
{
    struct stat status = {};
    int bytes = 0;
    if (::fstat(descriptor, &status) != 0 || !S_ISBLK(status.st_mode) ||
        ::ioctl(descriptor, BLKSSZGET, &bytes) != 0)
        return std::nullopt;
    return static_cast<std::uint32_t>(bytes);
}

}  // namespace pellar
