// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/bytes/Bytes.h"
#include "pellar/outcome/Result.h"
#include "pellar/process/FileDescriptor.h"

#include <cstdint>
#include <filesystem>
#include <optional>
#include <span>
#include <vector>

namespace pellar {

/// How much may be kept of what is written to a working copy, and where.
struct OverlayRoom {
    /// Absolute; made when it is needed. The file in it has no name, so none is left behind.
    std::filesystem::path directory;
    std::uint64_t mostBytes = ~std::uint64_t{0};
};

/// A region of a disk as it would be if it were written to, which it is not. Any thread.
class WorkingCopy {
public:
    virtual ~WorkingCopy() = default;

    virtual std::uint64_t bytes() const = 0;
    /// All of `bytes` from `start`, which lie within the region, or an errno: EIO where the disk
    /// cannot be read.
    [[nodiscard]] virtual int read(std::uint64_t start, std::span<std::uint8_t> bytes) = 0;
    /// Where it differs from the disk, in ascending order, by sectors of 512 bytes. An errno where
    /// either cannot be read.
    [[nodiscard]] virtual Result<std::vector<ByteRange>, int> differences() = 0;
    /// The first place, in time, that the disk refused to read; bytes from the region's start.
    virtual std::optional<std::uint64_t> firstUnreadable() const = 0;
    /// What was written to it did not find room.
    virtual bool isOutOfRoom() const = 0;
};

/// Of what starts at `start`, adds the sectors in which the two, of one length, differ.
void addDifferences(std::vector<ByteRange>& ranges, std::uint64_t start, ByteView before,
                    ByteView after);

/// A file that has no name, open for reading and writing; none, and errno.
[[nodiscard]] FileDescriptor makeNamelessFile(const OverlayRoom& room);

/// Bytes that may be added to a file: what others need of its file system stays free.
[[nodiscard]] std::uint64_t roomBeside(int file);

}  // namespace pellar
