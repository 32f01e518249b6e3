// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstdint>

namespace pellar {

/// By which a btrfs file system is known: in its superblock, and to the kernel.
using BtrfsId = std::array<std::uint8_t, 16>;

}  // namespace pellar
