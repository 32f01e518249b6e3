// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/overlay/WorkingCopy.h"

#include <cstdint>
#include <map>
#include <memory>
#include <mutex>

namespace pellar {

/// A region of a disk as it would be if it were written to: reads come from the disk until a place
/// is written, writes go to a file of ours, and the disk is never written to. Any thread.
class Overlay final : public WorkingCopy {
public:
    /// `disk` outlives it, open for reading. An errno when the file cannot be made.
    [[nodiscard]] static Result<std::unique_ptr<Overlay>, int> over(int disk, ByteRange region,
                                                                    const OverlayRoom& room);

    std::uint64_t bytes() const override { return region_.length; }

    [[nodiscard]] int read(std::uint64_t start, std::span<std::uint8_t> bytes) override;
    /// EFBIG past the end; ENOSPC when there is no room.
    [[nodiscard]] int write(std::uint64_t start, std::span<const std::uint8_t> bytes);
    [[nodiscard]] Result<std::vector<ByteRange>, int> differences() override;
    std::optional<std::uint64_t> firstUnreadable() const override;
    bool isOutOfRoom() const override;
    /// Bytes in the file: each place that was written counts as often as it is long, once.
    std::uint64_t keptBytes() const;

private:
    struct Extent {
        std::uint64_t bytes = 0;
        std::uint64_t place = 0;  ///< in the file
    };
    using Extents = std::map<std::uint64_t, Extent>;  ///< by start; they never overlap

    Overlay(int disk, ByteRange region, FileDescriptor file, std::uint64_t mostBytes)
        : disk_(disk), region_(region), file_(std::move(file)), mostBytes_(mostBytes)
    {
    }

    /// Of `range`, the part from its start that one source has: an extent, or the disk.
    struct Piece {
        ByteRange range;
        std::optional<std::uint64_t> place;
    };
    Piece firstPieceOf(ByteRange range) const;
    bool isHole(ByteRange place);
    int readDisk(std::uint64_t start, std::span<std::uint8_t> bytes);
    int append(std::uint64_t start, std::span<const std::uint8_t> bytes);
    bool hasRoomFor(std::uint64_t bytes);

    const int disk_;
    const ByteRange region_;
    const FileDescriptor file_;
    const std::uint64_t mostBytes_;

    mutable std::mutex mutex_;
    Extents extents_;
    std::uint64_t keptBytes_ = 0;
    std::uint64_t knownRoom_ = 0;  ///< bytes that may be appended before it is looked again
    ByteRange known_;              ///< of the disk: a hole, or data, to its end
    bool isKnownHole_ = false;
    std::optional<std::uint64_t> unreadable_;
    bool isOutOfRoom_ = false;
};

}  // namespace pellar
