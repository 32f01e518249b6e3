// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/pellar/DiskReference.h"
#include "pellar/probe/SpaceUse.h"

#include <cstdint>
#include <filesystem>
#include <optional>
#include <string>
#include <vector>

namespace orvane {

namespace diskType {

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

}  // namespace diskType

/// What is known about a disk at one moment: the library's reference to it, and what else the host
/// shows and decides by. Any thread may put it together. Labels and models are as they stand on
/// the medium: any bytes. The identifier is the node's path, of a part of an image "PATH#NUMBER";
/// the length is what the partition map states, even beyond the end.
struct DiskFacts : contract::DiskReference {
    std::int32_t type = diskType::whole;
    std::int64_t number = 0;
    /// Another one when the device was given another medium, or its name to another device; 0 when
    /// it is not known.
    std::uint64_t sequence = 0;
    /// Stands in the list of volumes that the user may work on.
    bool isShown = true;

    std::string label = {};
    std::string uuid = {};               ///< of the file system
    std::string filesystemVersion = {};  ///< as libblkid names it; mostly empty
    /// Of a volume, as it says itself; none where it does not, or cannot be read.
    std::optional<pellar::SpaceUse> space = {};
    std::string model = {};  ///< of the drive, of a whole disk; empty when it is not known

    bool isWritable = true;
    bool isBootVolume = false;
    bool containsUserHome = false;
    bool isBlankOptical = false;
    /// Of a whole disk: its drive can give the medium back, or it is a loop device.
    bool isEjectable = false;
    /// The drive says of itself that it is failing (SMART), or so does that of a part.
    bool hasSMARTError = false;
    /// Of the whole disk in an image: its partition map was found damaged when it was read.
    bool hasDamagedMap = false;
    std::string partitionMap = {};  ///< its kind, of a whole disk, as libblkid names it ("gpt")

    std::filesystem::path imagePath = {};  ///< of an image file that is not attached

    friend bool operator==(const DiskFacts&, const DiskFacts&) = default;
};

/// A disk with the disks inside it.
struct DiskTree {
    DiskFacts facts;
    std::vector<DiskTree> children;
};

}  // namespace orvane
