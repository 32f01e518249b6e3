// SPDX-License-Identifier: Apache-2.0
#include "fixwell/jobs/ActionListEntry.h"
#include "fixwell/module/OVFXW.h"

#include <utility>

namespace fixwell {
namespace {

constexpr std::chrono::milliseconds timeForDisksToAppear{500};

}  // namespace

void OVFXW::attachSelectedImages()
{
    for (const OVDiskPointer& image : std::exchange(imagesToAttach_, {})) {
        ++_deferredDisksNotYetAttached;
        detachAttachThread(image);
    }
}

// The worker gets the path, and nothing of the module but a token that says whether it is still
// there. An image without a path never reports back, so its job does not start.
void OVFXW::detachAttachThread(const OVDiskPointer& image)
{
    HostServices& services = host();
    services.threads().detachNewThread(
        [&services, module = liveness_, path = image->diskImagePath()] {
            if (path.empty())
                return;
            const OVDiskPointer topLevelDisk = attachThread(services, path);
            services.mainRunLoop().performOnMainThread(
                [module, topLevelDisk] {
                    if (*module != nullptr)
                        (*module)->attachFinished(topLevelDisk);
                },
                RunLoop::Wait::No);
        });
}

OVDiskPointer OVFXW::attachThread(HostServices& host, const std::string& path)
{
    Dictionary result;
    const ErrorCode code = host.imageAttachment().AttachImageWithURL(path, result);
    if (code != kPLNoError) {
        // The log belongs to the main thread.
        host.mainRunLoop().performOnMainThread(
            [&host, code] {
                host.log().ov_log(OVLog::error, 0, format("attach failed: %ld", {code}));
            },
            RunLoop::Wait::No);
        return nullptr;
    }
    host.threads().sleepUntil(host.threads().now() + timeForDisksToAppear);
    return host.imageAttachment().TopLevelPLDiskForImageDict(result);
}

void OVFXW::attachFinished(const OVDiskPointer& topLevelDisk)
{
    const DiskList volumes = diskController().viewablePartitions(topLevelDisk);
    if (topLevelDisk) {
        if (!topLevelDisk->children().empty()) {
            for (const OVDiskPointer& volume : volumes)
                if (diskNotInActionList(volume))
                    addDiskToActionList(volume, _deferredActionType);
        } else if (diskNotInActionList(topLevelDisk)) {
            addDiskToActionList(topLevelDisk, _deferredActionType);
        }
        _deferredDisks.push_back(topLevelDisk);
    }
    if (--_deferredDisksNotYetAttached != 0)
        return;
    totalActionsInJob = static_cast<std::int64_t>(actionList_.size());
    currentJob = 0;
    processActionList();
}

void OVFXW::clearDeferredDisks()
{
    for (const OVDiskPointer& disk : _deferredDisks)
        diskController().ejectDisk(disk, true);
    _deferredDisks.clear();
}

// The in-flight disk is left alone: its entry is filed before the timer fires.
void OVFXW::delayedMountDisk()
{
    for (const Array& entries : {actionList_, completedList}) {
        for (const Value& value : entries.values()) {
            const Dictionary entry = value.dictionary();
            const OVDiskPointer disk = diskOfEntry(entry);
            if (entry.boolean(kEntryDiskWasMounted) && disk && !disk->mountPoint())
                diskController().mountDisk(disk, false, true);
        }
    }
}

}  // namespace fixwell
