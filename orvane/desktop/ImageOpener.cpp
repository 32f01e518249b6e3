// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/ImageOpener.h"

#include "orvane/support/DiskLookup.h"

#include <utility>

namespace orvane::desktop {

ImageOpener::ImageOpener(SupportHost& host, Events events) : host_(host), events_(std::move(events))
{
    lifeline_->loop = &host.mainRunLoop();
    lifeline_->opener = this;
}

ImageOpener::~ImageOpener()
{
    const std::lock_guard guard(lifeline_->lock);
    lifeline_->loop = nullptr;
    lifeline_->opener = nullptr;
}

void ImageOpener::open(const std::vector<std::string>& names)
{
    DiskPointer first;
    std::vector<std::string> failures;
    for (const std::string& name : names) {
        const auto found = DiskLookup(host_.sharedDiskController(), host_.translator()).find(name);
        if (!found) {
            failures.push_back(found.error().message);
            continue;
        }
        const auto& disk = *found;
        if (!first)
            first = disk;
        if (disk->isOfflineDiskImage()) {
            read(disk->facts().imagePath);
            events_.imageOpened(disk->facts().imagePath);
        }
    }
    if (first)
        events_.opened(*first);
    if (!failures.empty())
        events_.failed(failures);
}

std::vector<std::string> ImageOpener::openImages() const
{
    std::vector<std::string> images;
    for (const DiskPointer& root : host_.sharedDiskController().roots())
        if (root->isOfflineDiskImage())
            images.push_back(root->facts().imagePath);
    return images;
}

// Not on the host's workers, which report in their order: a slow image would keep a job waiting
// whose own image was read long ago.
void ImageOpener::read(const std::filesystem::path& image)
{
    if (const auto [underWay, isNew] = inReading_.emplace(image, false); !isNew) {
        underWay->second = true;
        return;
    }
    const auto reading = std::make_shared<std::shared_ptr<ImageReading>>();
    const auto told = [lifeline = lifeline_, reading, image] {
        if (lifeline->opener != nullptr)
            lifeline->opener->finish(image, **reading);
    };
    const auto done = [lifeline = lifeline_, told] {
        const std::lock_guard guard(lifeline->lock);
        if (lifeline->loop != nullptr)
            lifeline->loop->post(told);
    };
    *reading = ImageReading::start(image, done, host_.imageAttachment().reader());
}

void ImageOpener::finish(const std::filesystem::path& image, const ImageReading& reading)
{
    const bool mustReadAgain = inReading_.extract(image).mapped();
    const auto result = reading.result();
    if (!isOpen(image) || !result)
        return;
    if (mustReadAgain)
        read(image);
    Known known;
    if (!*result) {
        known = known_[image];
        known.problem = host_.translator().text(result->error().message);
    } else {
        const auto& read = **result;
        known = {"", read.loopDevice, read.disks.facts.hasDamagedMap};
        host_.sharedDiskController().adopt(read.disks);
    }
    if (std::exchange(known_[image], known) != known)
        events_.changed();
}

bool ImageOpener::isOpen(const std::filesystem::path& image) const
{
    return host_.sharedDiskController().find([&](const Disk& disk) {
        return disk.isOfflineDiskImage() && disk.facts().imagePath == image;
    }) != nullptr;
}

void ImageOpener::refresh(const Disk& disk)
{
    if (canClose(disk) && isOpen(disk.facts().path))
        read(disk.facts().path);
}

void ImageOpener::refreshAll()
{
    for (const DiskPointer& root : host_.sharedDiskController().roots())
        if (root->isOfflineDiskImage())
            refresh(*root);
}

std::string ImageOpener::noteOn(const Disk& disk) const
{
    const auto found =
        disk.isOfflineDiskImage() ? known_.find(disk.facts().imagePath) : known_.end();
    if (found == known_.end())
        return {};
    const Translator& texts = host_.translator();
    const Known& known = found->second;
    if (!known.problem.empty())
        return texts.sentence("cannot be read: %@", {known.problem});
    if (known.hasDamagedMap)
        return texts.text("its partition map is damaged");
    return known.loopDevice.empty() ? std::string()
                                    : texts.sentence("it is attached as %@", {known.loopDevice});
}

bool ImageOpener::canClose(const Disk& disk)
{
    return disk.facts().storage == contract::DiskReference::Storage::FileRegion;
}

void ImageOpener::close(const Disk& disk)
{
    if (!canClose(disk))
        return;
    const std::filesystem::path image = disk.facts().path;
    known_.erase(image);
    DiskController& disks = host_.sharedDiskController();
    const auto roots = disks.roots();
    // What is in the image goes before the image.
    for (const bool isImage : {false, true})
        for (const DiskPointer& root : roots)
            if (canClose(*root) && root->isOfflineDiskImage() == isImage &&
                root->facts().path == image)
                disks.ejectDisk(root, true);
}

}  // namespace orvane::desktop
