// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/bytes/Bytes.h"

#include <span>

namespace pellar {

/// Bytes that can be read at any place: a disk's region, or a view that shows it repaired.
class RegionReader {
public:
    virtual ~RegionReader() = default;

    /// Bytes.
    [[nodiscard]] virtual std::uint64_t length() const = 0;
    /// Fills all of `bytes` from `place` on; 0, or errno.
    [[nodiscard]] virtual int read(std::uint64_t place, std::span<std::uint8_t> bytes) = 0;
};

/// A disk's region that is to be written.
class Region : public RegionReader {
public:
    /// All of `bytes`, from `place` on; 0, or errno. They are on the medium after `sync`.
    [[nodiscard]] virtual int write(std::uint64_t place, ByteView bytes) = 0;
    /// Waits until the medium has all that was written; 0, or errno.
    [[nodiscard]] virtual int sync() = 0;
    /// Lets the next reading come from the medium, as far as the kernel does that. After `sync`.
    virtual void forgetCached() = 0;
};

/// A stretch of an open file or block device. The descriptor is borrowed and outlives it. One
/// thread at a time.
class FileRegion final : public Region {
public:
    /// `offset` and `length` of the region within the file, bytes.
    FileRegion(int descriptor, std::uint64_t offset, std::uint64_t length)
        : descriptor_(descriptor), offset_(offset), length_(length)
    {
    }

    [[nodiscard]] std::uint64_t length() const override { return length_; }
    /// EFBIG when not all of the bytes are in the region, EIO when the file ends before it.
    [[nodiscard]] int read(std::uint64_t place, std::span<std::uint8_t> bytes) override;
    /// EFBIG when not all of the bytes are in the region, of which nothing is written then.
    [[nodiscard]] int write(std::uint64_t place, ByteView bytes) override;
    [[nodiscard]] int sync() override;
    /// A block device's cache is dropped as a whole (BLKFLSBUF, root only), a file's in the region.
    void forgetCached() override;

private:
    bool holds(std::uint64_t place, std::size_t count) const
    {
        return count <= length_ && place <= length_ - count;
    }

    int descriptor_;
    std::uint64_t offset_;
    std::uint64_t length_;
};

}  // namespace pellar
