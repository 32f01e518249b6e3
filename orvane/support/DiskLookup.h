// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/disks/DiskController.h"
#include "orvane/support/disks/SystemDisks.h"
#include "orvane/support/texts/Catalogue.h"

#include <string_view>

namespace orvane {

/// Finds the disk that a user means by what they wrote: a device, an image file, a mount point,
/// LABEL=…, UUID=…, or the identifier of a disk that is known. Main thread only.
class DiskLookup {
public:
    /// All must outlive this object.
    DiskLookup(DiskController& controller, const Translator& translator)
        : controller_(controller), translator_(translator)
    {
    }

    /// An image file or a device that was not known becomes known, and appears. Answers one
    /// sentence where there is no such disk. Never waits: not for a FIFO, not for a device.
    [[nodiscard]] Result<std::shared_ptr<Disk>, Failure> find(std::string_view name);

private:
    using Found = Result<std::shared_ptr<Disk>, Failure>;

    Found findByTag(std::string_view tag, std::string_view value);
    Found findFile(const std::filesystem::path& path);
    Found findDevice(const std::filesystem::path& path);
    Found findMountPoint(const std::filesystem::path& path);
    Found findImage(const std::filesystem::path& path);
    Failure cannotUse(std::string_view object, std::string_view reason) const;

    DiskController& controller_;
    const Translator& translator_;
};

}  // namespace orvane
