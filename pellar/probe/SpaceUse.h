// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/bytes/Bytes.h"

#include <cstdint>
#include <optional>
#include <string_view>

namespace pellar {

/// How much of a volume is taken, in bytes.
struct SpaceUse {
    std::uint64_t total = 0;
    std::uint64_t used = 0;

    friend bool operator==(const SpaceUse&, const SpaceUse&) = default;
};

/// What a volume that is not mounted says of itself in its superblock, without a look at what is
/// in it; `type` as libblkid names it. None for a kind that does not say it, for a journal that
/// waits (the numbers are then from before), and for numbers that cannot be true. Only reads, from
/// any thread.
[[nodiscard]] std::optional<SpaceUse> spaceUseOf(int descriptor, ByteRange volume,
                                                 std::string_view type);

/// Of what is mounted there, by statvfs(3); none where it does not answer. Waits for the file
/// system.
[[nodiscard]] std::optional<SpaceUse> spaceUseOfMount(const char* mountPoint);

}  // namespace pellar
