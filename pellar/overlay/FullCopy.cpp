// SPDX-License-Identifier: Apache-2.0
#include "pellar/overlay/FullCopy.h"

#include <fcntl.h>
#include <linux/fs.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>

namespace pellar {
namespace {

constexpr std::size_t largestPiece = 1U << 20U;

bool sharesBlocks(int disk, ByteRange region, int file)
{
    file_clone_range range = {};
    range.src_fd = disk;
    range.src_offset = region.offset;
    range.src_length = region.length;
    return ::ioctl(file, FICLONERANGE, &range) == 0;
}

/// The next stretch of `region` that is no hole, from `place` on; empty behind the last. A file
/// system that knows no holes has one stretch (lseek(2), SEEK_DATA).
ByteRange dataFrom(int disk, ByteRange region, std::uint64_t place)
{
    const off_t start = ::lseek(disk, static_cast<off_t>(place), SEEK_DATA);
    if (start < 0)
        return {region.end(), 0};
    const off_t end = ::lseek(disk, start, SEEK_HOLE);
    const auto from = std::min(static_cast<std::uint64_t>(start), region.end());
    const auto to = end < 0 ? region.end() : static_cast<std::uint64_t>(end);
    return {from, std::min(to, region.end()) - from};
}

std::uint64_t dataBytes(int disk, ByteRange region)
{
    std::uint64_t sum = 0;
    for (ByteRange data = dataFrom(disk, region, region.offset); data.length > 0;
         data = dataFrom(disk, region, data.end()))
        sum += data.length;
    return sum;
}

/// 0 or an errno.
int copyData(int disk, ByteRange region, int file, const std::function<bool()>& isStopped)
{
    Bytes buffer(largestPiece);
    for (ByteRange data = dataFrom(disk, region, region.offset); data.length > 0;
         data = dataFrom(disk, region, data.end()))
        for (std::uint64_t at = data.offset; at < data.end(); at += buffer.size()) {
            const std::span piece(buffer.data(),
                                  std::min<std::uint64_t>(buffer.size(), data.end() - at));
            if (isStopped())
                return ECANCELED;
            if (const int error = readAll(disk, at, piece))
                return error;
            if (const int error = writeAll(file, at - region.offset, piece))
                return error;
        }
    return 0;
}

}  // namespace

Result<std::unique_ptr<FullCopy>, int> FullCopy::of(int disk, ByteRange region,
                                                    const OverlayRoom& room,
                                                    const std::function<bool()>& isStopped)
{
    struct stat status = {};
    if (::fstat(disk, &status) != 0 || !S_ISREG(status.st_mode))
        return ENOTSUP;
    FileDescriptor file = makeNamelessFile(room);
    if (!file || ::ftruncate(file.get(), static_cast<off_t>(region.length)) != 0)
        return errno;
    if (!sharesBlocks(disk, region, file.get())) {
        const std::uint64_t needed = dataBytes(disk, region);
        if (needed > std::min(room.mostBytes, roomBeside(file.get())))
            return ENOSPC;
        if (const int error = copyData(disk, region, file.get(), isStopped))
            return error;
    }
    return std::unique_ptr<FullCopy>(new FullCopy(disk, region, std::move(file)));
}

int FullCopy::read(std::uint64_t start, std::span<std::uint8_t> bytes)
{
    return readAll(file_.get(), start, bytes);
}

// What is a hole in both was not written; what is none in either is compared.
Result<std::vector<ByteRange>, int> FullCopy::differences()
{
    std::vector<ByteRange> ranges;
    Bytes before(largestPiece);
    Bytes after(largestPiece);
    for (std::uint64_t at = 0; at < region_.length;) {
        const ByteRange copied = dataFrom(file_.get(), {0, region_.length}, at);
        const std::uint64_t original =
            dataFrom(disk_, region_, region_.offset + at).offset - region_.offset;
        at = std::max(at, std::min(copied.offset, original) / largestPiece * largestPiece);
        if (at >= region_.length)
            break;
        const auto count = std::min<std::uint64_t>(largestPiece, region_.length - at);
        const std::span was(before.data(), count);
        const std::span is(after.data(), count);
        if (const int error = readAll(disk_, region_.offset + at, was))
            return error;
        if (const int error = readAll(file_.get(), at, is))
            return error;
        addDifferences(ranges, at, was, is);
        at += count;
    }
    return ranges;
}

}  // namespace pellar
