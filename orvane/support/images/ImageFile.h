// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/disks/BlockProbe.h"
#include "orvane/support/disks/DiskFacts.h"
#include "orvane/support/files/Failure.h"
#include "orvane/support/texts/Catalogue.h"
#include "pellar/process/FileDescriptor.h"

#include <cstdint>
#include <filesystem>
#include <optional>
#include <vector>

namespace orvane {

/// A disk image, open for reading.
struct OpenImage {
    pellar::FileDescriptor descriptor;
    std::filesystem::path path;  ///< absolute, without symbolic links
    std::uint64_t length = 0;    ///< bytes, never 0
    bool isWritable = false;     ///< by this process
};

/// Opens a regular file that may be a disk image: it is not empty, and no text; otherwise the bare
/// reason ("the file is empty"). Any thread; does not wait for whatever else the path may name.
[[nodiscard]] Result<OpenImage, Failure> openImage(const std::filesystem::path& path,
                                                   const Translator& translator);

/// What lies in a stretch of an image.
struct ImageVolume {
    Partition partition;  ///< of a bare volume: number 0, the whole file
    Superblock superblock;
    bool hasExtBackup = false;
    std::optional<pellar::SpaceUse> space = {};

    /// The file system's type, also where only a backup superblock tells of one; else empty.
    std::string filesystem() const;
};

struct ImageContents {
    bool hasPartitionMap = false;  ///< also where it is damaged beyond reading
    bool isMapDamaged = false;
    std::string partitionMap = {};  ///< its kind, as libblkid names it; empty where unreadable
    /// Of the file as a whole, where there is no partition map.
    ImageVolume whole;
    std::vector<ImageVolume> partitions;
};

/// Reads the partition map and the superblocks through libblkid, without attaching anything. Any
/// thread.
[[nodiscard]] ImageContents readContents(const OpenImage& image);

/// An image file as the disk list shows it before it is attached: its canonical path identifies
/// it.
[[nodiscard]] DiskFacts factsOfImage(const OpenImage& image);

/// The disks that an image brings when it is attached. With a partition map: a whole disk, its
/// partitions as children, numbered as in the map. Otherwise one volume, the whole file. The
/// identifiers are "PATH#NUMBER", 0 for the top.
[[nodiscard]] DiskTree disksOfImage(const OpenImage& image, const ImageContents& contents);

}  // namespace orvane
