// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/UTF8.h"
#include "contract/support/OVDisk.h"
#include "orvane/support/disks/DiskFacts.h"
#include "orvane/support/disks/DiskHistory.h"

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace orvane {

/// What the installed tools can do for one type of file system.
struct FilesystemCapabilities {
    bool canVerify = false;
    bool canRepair = false;
    bool canVerifyLive = false;
};

/// Asked on the main thread, with the type as libblkid names it.
using CapabilityLookup = std::function<FilesystemCapabilities(std::string_view filesystemType)>;

/// A file system type with what can be done for it, asked anew each time: a tool may be installed
/// while the program runs.
class DiskFilesystem final : public contract::OVFilesystem {
public:
    DiskFilesystem(std::string type, CapabilityLookup capabilities)
        : type_(std::move(type)), capabilities_(std::move(capabilities))
    {
    }

    std::string filesystemType() const override { return type_; }
    bool canBeRepaired() const override { return capabilities_(type_).canRepair; }
    bool canBeVerified() const override { return capabilities_(type_).canVerify; }
    bool supportsLiveVerify() const override { return capabilities_(type_).canVerifyLive; }

private:
    std::string type_;
    CapabilityLookup capabilities_;
};

/// A disk of the host: facts, and where its history is kept. Main thread only, except that any
/// thread may make one and hand it over.
class Disk final : public contract::OVDisk, public std::enable_shared_from_this<Disk> {
public:
    /// What every disk needs of the host. All must outlive the disks.
    struct Surroundings {
        CapabilityLookup capabilities;
        HistoryKeeper* histories = nullptr;
    };

    /// A disk and, below it, its children.
    static std::shared_ptr<Disk> make(const DiskTree& tree, const Surroundings& surroundings);
    Disk(DiskFacts facts, Surroundings surroundings);

    const DiskFacts& facts() const { return facts_; }
    /// The identifier must stay as it is.
    void setFacts(const DiskFacts& facts);
    const std::vector<std::shared_ptr<Disk>>& parts() const { return children_; }
    void setParts(std::vector<std::shared_ptr<Disk>> parts);
    /// The medium is gone, though the object is still needed: nothing can begin on it any more.
    void setGone();
    bool hasGone() const { return hasGone_; }
    /// An image file shows the histories of what was found in it, also after it was detached.
    void setContents(std::shared_ptr<Disk> contents);
    /// None for what is no image file, or was never attached.
    const std::shared_ptr<Disk>& contents() const { return contents_; }

    std::string diskIdentifier() const override { return facts_.identifier; }
    /// Fit to be shown: a label with a line end or an escape sequence must not forge a log.
    std::string displayName() const override { return contract::printable(facts_.name); }
    std::int32_t diskType() const override { return facts_.type; }
    std::int64_t diskNumber() const override { return facts_.number; }
    bool isWhole() const override { return facts_.isWhole; }
    /// Of what lies in an image, the image: the whole disk in it is in no list.
    std::shared_ptr<OVDisk> parentDisk() const override;
    std::vector<std::shared_ptr<OVDisk>> children() const override;
    std::optional<std::string> mountPoint() const override
    {
        return isMounted() ? std::optional(facts_.mountPoint) : std::nullopt;
    }
    bool isMounted() const override { return !facts_.mountPoint.empty(); }
    bool isWritableVolume() const override { return facts_.isWritable; }
    bool isBootVolume() const override { return facts_.isBootVolume; }
    bool containUserHomeDirectory() const override { return facts_.containsUserHome; }
    bool hasSMARTError() const override { return facts_.hasSMARTError; }
    bool isDVDRAM() const override { return false; }
    bool hasBlankOpticalMedia() const override { return facts_.isBlankOptical; }
    bool isOfflineDiskImage() const override { return facts_.type == diskType::diskImage; }
    std::string diskImagePath() const override { return facts_.imagePath.native(); }
    bool permissionsEnabled() const override;
    /// It is the root of a system whose package database the library knows.
    bool canRepairPermissions() const override;
    const contract::OVFilesystem* filesystem() const override;
    contract::DiskReferencePointer theKRDisk() const override { return reference_; }

    contract::Array fsckHistory() const override;
    contract::Array fsckHistoryNoChildren() const override;
    void setFsckHistory(const contract::Array& history) override;
    bool clearFsckHistory() override;

private:
    std::vector<std::shared_ptr<Disk>> inside() const;
    void collect(std::vector<const Disk*>& disks) const;

    DiskFacts facts_;
    bool hasGone_ = false;
    Surroundings surroundings_;
    std::unique_ptr<DiskFilesystem> filesystem_;  ///< none where there is no file system
    contract::DiskReferencePointer reference_;
    std::weak_ptr<Disk> parent_;
    std::vector<std::shared_ptr<Disk>> children_;
    std::shared_ptr<Disk> contents_;
    std::weak_ptr<Disk> image_;  ///< of a disk that is the contents of one

    mutable contract::Array own_;
    mutable std::uint64_t ownRevision_ = 0;  ///< of the keeper, when it was asked
    mutable MergedHistory merged_;
};

}  // namespace orvane
