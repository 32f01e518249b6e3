// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/bytes/Bytes.h"

#include <optional>

namespace pellar {

/// A disk as its partition map sees it: numbered sectors of one size.
class Sectors {
public:
    virtual ~Sectors() = default;

    /// Logical, as partition maps count: 512 or 4096.
    virtual std::uint32_t sectorBytes() const = 0;
    /// Whole sectors; what is left behind the last belongs to none.
    virtual std::uint64_t count() const = 0;
    /// None when not all of them are on the disk, or one cannot be read. `number` is small: what is
    /// asked for is kept in memory.
    [[nodiscard]] virtual std::optional<Bytes> read(std::uint64_t first,
                                                    std::uint64_t number) const = 0;
};

/// Whether sectors `first` to `first + number - 1` are all there; computed without overflow.
constexpr bool isOnDisk(std::uint64_t first, std::uint64_t number, std::uint64_t count)
{
    return number <= count && first <= count - number;
}

/// The sectors of an open disk or image. The descriptor is borrowed and outlives it. Any thread.
class FileSectors final : public Sectors {
public:
    /// `offset` and `length` of the disk within the file, bytes.
    FileSectors(int descriptor, std::uint64_t offset, std::uint64_t length,
                std::uint32_t sectorBytes)
        : descriptor_(descriptor),
          offset_(offset),
          count_(length / sectorBytes),
          sectorBytes_(sectorBytes)
    {
    }

    std::uint32_t sectorBytes() const override { return sectorBytes_; }
    std::uint64_t count() const override { return count_; }
    [[nodiscard]] std::optional<Bytes> read(std::uint64_t first,
                                            std::uint64_t number) const override;

    /// Writes whole sectors and waits until they are on the medium; 0, or errno. EFBIG when they
    /// are not all on the disk, which then stays as it is.
    [[nodiscard]] int write(std::uint64_t first, ByteView bytes) const;
    /// Lets the next reading come from the medium, as far as the kernel does that.
    void forgetCached() const;

private:
    int descriptor_;
    std::uint64_t offset_;
    std::uint64_t count_;
    std::uint32_t sectorBytes_;
};

/// The size of a device's logical sectors. None for a file, which does not tell its own.
[[nodiscard]] std::optional<std::uint32_t> deviceSectorBytes(int descriptor);

}  // namespace pellar
