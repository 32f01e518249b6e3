// SPDX-License-Identifier: Apache-2.0
#include "pellar/disks/Readability.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>

namespace pellar {

std::vector<ByteRange> endsOfVolume(std::uint64_t availableBytes)
{
    constexpr std::uint64_t beginning = 64U << 20U;
    constexpr std::uint64_t end = 1U << 20U;
    if (availableBytes <= beginning + end)
        return {{0, availableBytes}};
    return {{0, beginning}, {availableBytes - end, end}};
}

// A long read fails as a whole where only its end is bad, so what failed is read again by pages.
std::optional<std::uint64_t> firstUnreadable(int descriptor, std::uint64_t offset,
                                             const std::vector<ByteRange>& pieces,
                                             const std::function<bool()>& isStopped)
{
    constexpr std::uint64_t page = 4096;
    std::vector<char> buffer(1U << 20U);
    // What was read before is not what the disk answers now.
    ::posix_fadvise(descriptor, 0, 0, POSIX_FADV_DONTNEED);
    for (const ByteRange& piece : pieces) {
        std::uint64_t step = buffer.size();
        for (std::uint64_t done = 0; done < piece.length && !isStopped();) {
            const std::uint64_t place = offset + piece.offset + done;
            const std::uint64_t toPageEnd = step > page ? step : page - place % page;
            const ssize_t count =
                ::pread(descriptor, buffer.data(), std::min(toPageEnd, piece.length - done),
                        static_cast<off_t>(place));
            if (count <= 0 && step == page && (count == 0 || errno != EINTR))
                return piece.offset + done;
            if (count <= 0)
                step = page;
            else
                done += static_cast<std::uint64_t>(count);
        }
    }
    return std::nullopt;
}

}  // namespace pellar
