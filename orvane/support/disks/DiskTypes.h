// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

namespace orvane::diskType {

// What the numbers that OVDisk::diskType answers mean in this host. The numbers themselves are
// fixed by the modules: they leave 2, 4 and 15 out of their selection, put the parent in the
// place of 8, and have 5 attached first.

inline constexpr std::int32_t whole = 1;       ///< a whole disk with a partition map, or blank
inline constexpr std::int32_t container = 2;   ///< an extended partition, or one with a map inside
inline constexpr std::int32_t volume = 3;      ///< a volume in a partition
inline constexpr std::int32_t freeSpace = 4;   ///< belongs to no partition
inline constexpr std::int32_t diskImage = 5;   ///< an image file that is not attached
inline constexpr std::int32_t bareVolume = 6;  ///< a volume that fills a whole device or image
inline constexpr std::int32_t subvolume = 8;   ///< a snapshot or subvolume, stands for its parent
inline constexpr std::int32_t assembled = 12;  ///< a volume made of other devices (LVM, RAID)
inline constexpr std::int32_t opticalDisc = 15;

}  // namespace orvane::diskType
