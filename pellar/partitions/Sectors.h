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

}  // namespace pellar
