// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/bytes/Bytes.h"

#include <cstdint>
#include <functional>
#include <optional>
#include <vector>

namespace pellar {

/// The beginning and the end of a volume, where file systems keep what they are built on: as much
/// as is read in a second or two.
std::vector<ByteRange> endsOfVolume(std::uint64_t availableBytes);

/// The first byte of these pieces that the kernel cannot read, from the volume's start; none when
/// all can be read, or `isStopped` says so before. `offset` is where on the disk the volume begins;
/// the pieces lie on the disk.
std::optional<std::uint64_t> firstUnreadable(int descriptor, std::uint64_t offset,
                                             const std::vector<ByteRange>& pieces,
                                             const std::function<bool()>& isStopped);

}  // namespace pellar
