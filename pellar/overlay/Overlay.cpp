// SPDX-License-Identifier: Apache-2.0
#include "pellar/overlay/Overlay.h"

#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <memory>

namespace pellar {
namespace {

constexpr std::uint64_t sectorBytes = 512;

}  // namespace
Result<std::unique_ptr<Overlay>, int> Overlay::over(int disk, ByteRange region,
                                                    const OverlayRoom& room)
{
    FileDescriptor file = makeNamelessFile(room);
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

/// The kernel keeps a page in memory for each page of a hole that is read, which takes longer than
/// all the rest. A device, and a file system that knows no holes, has data only (lseek(2)).
bool Overlay::isHole(ByteRange place)
{
    if (place.offset < known_.offset || place.offset >= known_.end()) {
        const auto from = static_cast<off_t>(place.offset);
        const off_t data = ::lseek(disk_, from, SEEK_DATA);
        isKnownHole_ = data != from;
        off_t end = data;
        if (!isKnownHole_)
            end = ::lseek(disk_, from, SEEK_HOLE);
        else if (data < 0)
            end = errno == ENXIO ? ::lseek(disk_, 0, SEEK_END) : from;
        known_ = {place.offset, static_cast<std::uint64_t>(std::max(end, from) - from)};
    }
    return isKnownHole_ && place.end() <= known_.end();
}

int Overlay::readDisk(std::uint64_t start, std::span<std::uint8_t> bytes)
{
    if (isHole({region_.offset + start, bytes.size()})) {
        std::ranges::fill(bytes, std::uint8_t{0});
        return 0;
    }
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
                std::min<std::uint64_t>(most - place % sectorBytes, extent.bytes - done));
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
