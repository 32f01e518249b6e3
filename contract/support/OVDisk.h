// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Array.h"
#include "contract/foundation/Value.h"
#include "contract/pellar/DiskReference.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace contract {

/// What the host knows about a volume's file system.
class OVFilesystem {
public:
    virtual ~OVFilesystem() = default;

    /// As libblkid names it: "ext4", "vfat", ...
    virtual std::string filesystemType() const = 0;
    /// There is an installed tool that can repair it (verify it), and doing so is sound.
    virtual bool canBeRepaired() const = 0;
    virtual bool canBeVerified() const = 0;
    /// It can be verified while it is mounted for writing.
    virtual bool supportsLiveVerify() const = 0;
};

/// A whole disk, a volume, or a disk image, as the host's list shows it. Main thread only.
///
/// The host keeps these objects, and with them the check history, as long as the disk is known.
class OVDisk : public Object {
public:
    // The disk types that the module tells apart. Other numbers are the host's own.
    static constexpr std::int32_t typeWhole = 1;
    static constexpr std::int32_t typeDiskImage = 5;  ///< not attached yet

    /// Unique among the disks known at one time; equal disks have equal identifiers.
    virtual std::string diskIdentifier() const = 0;
    /// What the user calls it. Hostile input: any bytes, any length.
    virtual std::string displayName() const = 0;
    virtual std::int32_t diskType() const = 0;
    virtual std::int64_t diskNumber() const = 0;
    virtual bool isWhole() const = 0;

    virtual std::shared_ptr<OVDisk> parentDisk() const = 0;
    virtual std::vector<std::shared_ptr<OVDisk>> children() const = 0;

    /// None when not mounted. A mount point without a length is a mount in doubt: some callers
    /// count it as mounted, others do not.
    virtual std::optional<std::string> mountPoint() const = 0;
    virtual bool isMounted() const = 0;
    virtual bool isWritableVolume() const = 0;
    virtual bool isBootVolume() const = 0;
    virtual bool containUserHomeDirectory() const = 0;
    virtual bool hasSMARTError() const = 0;
    virtual bool isDVDRAM() const = 0;
    virtual bool hasBlankOpticalMedia() const = 0;

    /// An image file that is not attached; its path may be empty when it is not known.
    virtual bool isOfflineDiskImage() const = 0;
    virtual std::string diskImagePath() const = 0;

    /// The volume honours file owners, and its files come from packages that can be compared.
    virtual bool permissionsEnabled() const = 0;
    virtual bool canRepairPermissions() const = 0;

    /// None when the file system is not known or there is none.
    virtual const OVFilesystem* filesystem() const = 0;
    virtual DiskReferencePointer theKRDisk() const = 0;

    /// The disk's own records and those of its child disks, oldest first within each disk; no
    /// array when there never was one.
    virtual Array fsckHistory() const = 0;
    /// The disk's own records: the list that new ones are appended to, or no array.
    virtual Array fsckHistoryNoChildren() const = 0;
    virtual void setFsckHistory(const Array& history) = 0;
    /// YES when something was removed.
    virtual bool clearFsckHistory() = 0;

    bool isEqual(const Object& other) const override
    {
        const auto* const disk = dynamic_cast<const OVDisk*>(&other);
        return disk != nullptr && disk->diskIdentifier() == diskIdentifier();
    }
    std::string description() const override { return diskIdentifier(); }
};

using OVDiskPointer = std::shared_ptr<OVDisk>;

/// Mounted at a place that has a name.
inline bool hasMountPoint(const OVDisk& disk)
{
    return !disk.mountPoint().value_or(std::string()).empty();
}

/// For a line of the log.
inline std::string identifierOf(const OVDiskPointer& disk)
{
    return disk ? disk->diskIdentifier() : std::string("(none)");
}

}  // namespace contract
