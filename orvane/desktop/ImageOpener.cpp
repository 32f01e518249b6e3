// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/ImageOpener.h"

#include "orvane/support/disks/DiskLookup.h"

namespace orvane::desktop {

void ImageOpener::open(const std::vector<std::string>& names)
{
    DiskPointer first;
    std::vector<std::string> failures;
    for (const std::string& name : names) {
        const auto found = DiskLookup(host_.sharedDiskController(), host_.translator()).find(name);
        if (failed(found)) {
            failures.push_back(failureMessage(found));
            continue;
        }
        const auto& disk = std::get<DiskPointer>(found);
        if (!first)
            first = disk;
        if (disk->isOfflineDiskImage())
            attach(disk);
    }
    if (first)
        events_.opened(*first);
    if (!failures.empty())
        events_.failed(failures);
}

void ImageOpener::attach(const DiskPointer& image)
{
    SupportHost& host = host_;
    host.threads().detachNewThread([&host, path = image->facts().imagePath] {
        fixwell::Dictionary result;
        if (host.imageAttachment().AttachImageWithURL(path, result) != fixwell::kPLNoError)
            return;
        host.mainRunLoop().performOnMainThread(
            [&host, result, path] {
                const auto top = std::dynamic_pointer_cast<Disk>(
                    host.imageAttachment().TopLevelPLDiskForImageDict(result));
                const bool isStillOpen = host.sharedDiskController().find([&](const Disk& disk) {
                    return disk.isOfflineDiskImage() && disk.facts().imagePath == path;
                }) != nullptr;
                if (top && isStillOpen)
                    host.sharedDiskController().adopt(top);
            },
            fixwell::RunLoop::Wait::No);
    });
}

bool ImageOpener::canEject(const Disk& disk)
{
    return disk.facts().storage == fixwell::DiskReference::Storage::FileRegion;
}

void ImageOpener::eject(const Disk& disk)
{
    if (!canEject(disk))
        return;
    const std::filesystem::path image = disk.facts().path;
    DiskController& disks = host_.sharedDiskController();
    const auto roots = disks.roots();
    // What is in the image goes before the image.
    for (const bool isImage : {false, true})
        for (const DiskPointer& root : roots)
            if (canEject(*root) && root->isOfflineDiskImage() == isImage &&
                root->facts().path == image)
                disks.ejectDisk(root, true);
}

}  // namespace orvane::desktop
