// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/SupportHost.h"
#include "orvane/support/images/ImageAttacher.h"

#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

namespace orvane::desktop {

/// Brings disk images into the list of disks, keeps up with what is in them, and takes them out
/// again. Main thread.
class ImageOpener {
public:
    using DiskPointer = std::shared_ptr<Disk>;

    struct Events {
        /// The first of the disks that were opened together.
        std::function<void(const Disk& disk)> opened;
        /// An image came into the list.
        std::function<void(const std::string& image)> imageOpened;
        /// One sentence for each that could not be opened.
        std::function<void(const std::vector<std::string>& sentences)> failed;
        /// Something else is known about an image.
        std::function<void()> changed;
    };

    /// The host outlives this object.
    ImageOpener(SupportHost& host, Events events);
    ImageOpener(const ImageOpener&) = delete;
    ImageOpener& operator=(const ImageOpener&) = delete;
    /// Does not wait for images that are being read; nothing is heard of them any more.
    ~ImageOpener();

    /// Image files, or anything else that names a disk (orvane/support/disks/DiskLookup.h). What
    /// an image holds is read behind the window's back, and appears when it is known.
    void open(const std::vector<std::string>& names);
    /// The files of the images that are open, in the list's order.
    std::vector<std::string> openImages() const;
    /// Reads an open image again: it may have gone, or hold something else by now. Other disks are
    /// left alone.
    void refresh(const Disk& disk);
    void refreshAll();

    /// YES for an image file and for what is in one.
    static bool canClose(const Disk& disk);
    /// Forgets the image that the disk is, or lies in. The file and its history stay.
    void close(const Disk& disk);

    /// What is out of the ordinary about an open image, in a few words of the user's language: it
    /// cannot be read, is a device as well, or its partition map is damaged. Mostly empty.
    std::string noteOn(const Disk& disk) const;

private:
    /// What reaches this object from a reader's thread, as long as it is there.
    struct Lifeline {
        std::mutex lock;
        EventLoop* loop = nullptr;      ///< guarded; none when the opener has gone
        ImageOpener* opener = nullptr;  ///< main thread
    };
    struct Known {
        std::string problem;  ///< why it could not be read
        std::string loopDevice;
        bool hasDamagedMap = false;

        friend bool operator==(const Known&, const Known&) = default;
    };

    void read(const std::filesystem::path& image);
    void finish(const std::filesystem::path& image, const ImageReading& reading);
    bool isOpen(const std::filesystem::path& image) const;

    SupportHost& host_;
    Events events_;
    std::map<std::filesystem::path, Known> known_;
    /// YES: it must be read once more, because what is being read may be out of date.
    std::map<std::filesystem::path, bool> inReading_;
    std::shared_ptr<Lifeline> lifeline_ = std::make_shared<Lifeline>();
};

}  // namespace orvane::desktop
