// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <filesystem>
#include <memory>
#include <string>

namespace contract {

/// The platform's low-level reference to a disk: a block device, or a region of a regular file,
/// so that a volume inside an image can be checked without privileges and without attaching it.
/// A plain value; the module passes it to the library unchanged.
struct DiskReference {
    enum class Storage { BlockDevice, FileRegion };

    Storage storage = Storage::BlockDevice;
    std::filesystem::path path;  ///< of the device node or of the image file
    std::uint64_t offset = 0;    ///< bytes from the start of the file; 0 for a device
    std::uint64_t length = 0;    ///< bytes

    std::string identifier;  ///< the host's identifier of the disk; two disks never share one
    std::string name;        ///< what the user calls the disk; any bytes
    std::string filesystem;  ///< as libblkid names it ("ext4"); empty when unknown
    std::string mountPoint;  ///< empty when not mounted
    bool isWhole = false;    ///< a disk with a partition map, not a volume

    friend bool operator==(const DiskReference&, const DiskReference&) = default;
};

/// None where a disk has no reference (nothing stands behind it any more).
using DiskReferencePointer = std::shared_ptr<const DiskReference>;

}  // namespace contract
