// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/partitions/Sectors.h"

namespace pellar {

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
