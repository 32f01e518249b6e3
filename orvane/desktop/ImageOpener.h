// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/SupportHost.h"

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace orvane::desktop {

/// Brings disk images into the list of disks and takes them out again. Main thread.
class ImageOpener {
public:
    using DiskPointer = std::shared_ptr<Disk>;

    struct Events {
        /// The first of the disks that were opened together.
        std::function<void(const Disk& disk)> opened;
        /// One sentence for each that could not be opened.
        std::function<void(const std::vector<std::string>& sentences)> failed;
    };

    /// The host outlives this object.
    ImageOpener(SupportHost& host, Events events) : host_(host), events_(std::move(events)) {}

    /// Image files, or anything else that names a disk (orvane/support/disks/DiskLookup.h). What
    /// an image holds is read behind the window's back, and appears when it is known.
    void open(const std::vector<std::string>& names);

    /// YES for an image file and for what is in one.
    static bool canEject(const Disk& disk);
    /// Forgets the image that the disk is, or lies in. The file and its history stay.
    void eject(const Disk& disk);

private:
    void attach(const DiskPointer& image);

    SupportHost& host_;
    Events events_;
};

}  // namespace orvane::desktop
