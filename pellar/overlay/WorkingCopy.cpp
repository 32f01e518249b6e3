// SPDX-License-Identifier: Apache-2.0
#include "pellar/overlay/WorkingCopy.h"

#include <fcntl.h>
#include <sys/statvfs.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <string>
#include <system_error>

namespace pellar {
namespace {

constexpr std::uint64_t sector = 512;

void addRange(std::vector<ByteRange>& ranges, ByteRange range)
{
    if (!ranges.empty() && ranges.back().end() >= range.offset)
        ranges.back().length = std::max(ranges.back().end(), range.end()) - ranges.back().offset;
    else
        ranges.push_back(range);
}

}  // namespace

// Without a name from the beginning where the file system can do that (open(2), O_TMPFILE).
FileDescriptor makeNamelessFile(const OverlayRoom& room)
{
    const std::filesystem::path& directory = room.directory;
    std::error_code error;
    std::filesystem::create_directories(directory, error);
    FileDescriptor file(::open(directory.c_str(), O_TMPFILE | O_RDWR | O_CLOEXEC, 0600));
    if (file || (errno != EOPNOTSUPP && errno != EISDIR))
        return file;
    std::string name = directory / "overlay-XXXXXX";
    FileDescriptor named(::mkostemp(name.data(), O_CLOEXEC));
    if (named)
        ::unlink(name.c_str());
    return named;
}

std::uint64_t roomBeside(int file)
{
    constexpr std::uint64_t mostReserved = 64U << 20U;
    struct statvfs status = {};
    if (::fstatvfs(file, &status) != 0)
        return 0;
    const std::uint64_t all = status.f_blocks * status.f_frsize;
    const std::uint64_t free = status.f_bavail * status.f_frsize;
    const std::uint64_t reserved = std::min(mostReserved, all / 20);
    return free > reserved ? free - reserved : 0;
}

void addDifferences(std::vector<ByteRange>& ranges, std::uint64_t start, ByteView before,
                    ByteView after)
{
    for (std::size_t at = 0, count = 0; at < before.size(); at += count) {
        const std::size_t toBoundary = sector - (start + at) % sector;
        count = std::min(toBoundary, before.size() - at);
        if (!std::ranges::equal(before.subspan(at, count), after.subspan(at, count)))
            addRange(ranges, {start + at, count});
    }
}

}  // namespace pellar
