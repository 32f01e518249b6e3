// SPDX-License-Identifier: Apache-2.0
#include "pellar/overlay/Overlay.h"

#include <fcntl.h>
#include <sys/statvfs.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <memory>
#include <string>
#include <system_error>

namespace pellar {
namespace {

constexpr std::uint64_t sector = 512;

/// Without a name from the beginning where the file system can do that (open(2), O_TMPFILE).
FileDescriptor namelessFileIn(const std::filesystem::path& directory)
{
    FileDescriptor file(::open(directory.c_str(), O_TMPFILE | O_RDWR | O_CLOEXEC, 0600));
    if (file || (errno != EOPNOTSUPP && errno != EISDIR))
        return file;
    std::string name = directory / "overlay-XXXXXX";
    FileDescriptor named(::mkostemp(name.data(), O_CLOEXEC));
    if (named)
        ::unlink(name.c_str());
    return named;
}

/// What others need of the file system stays free.
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

void addRange(std::vector<ByteRange>& ranges, ByteRange range)
{
    if (!ranges.empty() && ranges.back().end() >= range.offset)
        ranges.back().length = std::max(ranges.back().end(), range.end()) - ranges.back().offset;
    else
        ranges.push_back(range);
}

/// Of what starts at `start`, the sectors in which the two differ.
void addDifferences(std::vector<ByteRange>& ranges, std::uint64_t start,
                    std::span<const std::uint8_t> before, std::span<const std::uint8_t> after)
{
    for (std::size_t at = 0, count = 0; at < before.size(); at += count) {
        const std::size_t toBoundary = sector - (start + at) % sector;
        count = std::min(toBoundary, before.size() - at);
        if (!std::ranges::equal(before.subspan(at, count), after.subspan(at, count)))
            addRange(ranges, {start + at, count});
    }
}

}  // namespace

Result<std::unique_ptr<Overlay>, int> Overlay::over(int disk, ByteRange region,
                                                    const OverlayRoom& room)
{
    std::error_code error;
    std::filesystem::create_directories(room.directory, error);
    FileDescriptor file = namelessFileIn(room.directory);
    if (!file)
        return errno;
    return std::unique_ptr<Overlay>(new Overlay(disk, region, std::move(file), room.mostBytes));
}

Overlay::Piece Overlay::firstPieceOf(ByteRange range) const
{
    auto next = extents_.upper_bound(range.offset);
    if (next != extents_.begin()) {
        const auto& [start, extent] = *std::prev(next);
        const std::uint64_t into = range.offset - start;
        if (into < extent.bytes)
            return {{range.offset, std::min(range.length, extent.bytes - into)},
                    extent.place + into};
    }
    const std::uint64_t end = next == extents_.end() ? range.end() : next->first;
    return {{range.offset, std::min(range.end(), end) - range.offset}, std::nullopt};
}

int Overlay::readDisk(std::uint64_t start, std::span<std::uint8_t> bytes)
{
    const int error = readAll(disk_, region_.offset + start, bytes);
    if (error != 0 && !unreadable_)
        unreadable_ = start;
    return error == 0 ? 0 : EIO;
}

int Overlay::read(std::uint64_t start, std::span<std::uint8_t> bytes)
{
    const std::lock_guard lock(mutex_);
    while (!bytes.empty()) {
        const Piece piece = firstPieceOf({start, bytes.size()});
        const auto part = bytes.first(piece.range.length);
        const int error =
            piece.place ? readAll(file_.get(), *piece.place, part) : readDisk(start, part);
        if (error != 0)
            return EIO;
        start += part.size();
        bytes = bytes.subspan(part.size());
    }
    return 0;
}

int Overlay::readOriginal(std::uint64_t start, std::span<std::uint8_t> bytes)
{
    const std::lock_guard lock(mutex_);
    return readDisk(start, bytes);
}

int Overlay::write(std::uint64_t start, std::span<const std::uint8_t> bytes)
{
    if (start > region_.length || bytes.size() > region_.length - start)
        return EFBIG;
    const std::lock_guard lock(mutex_);
    while (!bytes.empty()) {
        const Piece piece = firstPieceOf({start, bytes.size()});
        const auto part = bytes.first(piece.range.length);
        const int error =
            piece.place ? writeAll(file_.get(), *piece.place, part) : append(start, part);
        if (error != 0)
            return error;
        start += part.size();
        bytes = bytes.subspan(part.size());
    }
    return 0;
}

int Overlay::append(std::uint64_t start, std::span<const std::uint8_t> bytes)
{
    int error = hasRoomFor(bytes.size()) ? 0 : ENOSPC;
    if (error == 0)
        error = writeAll(file_.get(), keptBytes_, bytes);
    isOutOfRoom_ = isOutOfRoom_ || error == ENOSPC || error == EDQUOT || error == EFBIG;
    if (error != 0)
        return isOutOfRoom_ ? ENOSPC : error;
    const auto next = extents_.lower_bound(start);
    const auto before = next == extents_.begin() ? extents_.end() : std::prev(next);
    const bool isContinued = before != extents_.end() &&
                             before->first + before->second.bytes == start &&
                             before->second.place + before->second.bytes == keptBytes_;
    if (isContinued)
        before->second.bytes += bytes.size();
    else
        extents_.emplace_hint(next, start, Extent{bytes.size(), keptBytes_});
    keptBytes_ += bytes.size();
    return 0;
}

bool Overlay::hasRoomFor(std::uint64_t bytes)
{
    constexpr std::uint64_t step = 16U << 20U;
    if (bytes > mostBytes_ - std::min(mostBytes_, keptBytes_))
        return false;
    if (bytes > knownRoom_)
        knownRoom_ = std::min(step, roomBeside(file_.get()));
    if (bytes > knownRoom_)
        return false;
    knownRoom_ -= bytes;
    return true;
}

Result<std::vector<ByteRange>, int> Overlay::differences()
{
    constexpr std::size_t most = 1U << 20U;
    const std::lock_guard lock(mutex_);
    std::vector<ByteRange> ranges;
    std::vector<std::uint8_t> before(most);
    std::vector<std::uint8_t> after(most);
    for (const auto& [start, extent] : extents_)
        for (std::uint64_t done = 0; done < extent.bytes;) {
            // Up to a sector's boundary, so that the sectors are the disk's.
            const std::uint64_t place = start + done;
            const auto count = static_cast<std::size_t>(
                std::min<std::uint64_t>(most - place % sector, extent.bytes - done));
            const std::span original(before.data(), count);
            const std::span written(after.data(), count);
            if (const int error = readDisk(place, original))
                return error;
            if (const int error = readAll(file_.get(), extent.place + done, written))
                return error;
            addDifferences(ranges, place, original, written);
            done += count;
        }
    return ranges;
}

std::optional<std::uint64_t> Overlay::firstUnreadable() const
{
    const std::lock_guard lock(mutex_);
    return unreadable_;
}

bool Overlay::isOutOfRoom() const
{
    const std::lock_guard lock(mutex_);
    return isOutOfRoom_;
}

std::uint64_t Overlay::keptBytes() const
{
    const std::lock_guard lock(mutex_);
    return keptBytes_;
}

}  // namespace pellar
