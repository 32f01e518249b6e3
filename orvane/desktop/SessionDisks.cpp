// SPDX-License-Identifier: Apache-2.0
// How the list follows the disks that come, go and change, also while a job runs.

#include "orvane/desktop/DesktopSession.h"

#include <algorithm>
#include <iterator>
#include <utility>

namespace orvane::desktop {

// Watched before they are read, so that nothing is missed in between. Without the watch the
// command to rescan is still there, so nobody is bothered with a sheet.
void DesktopSession::watchSystemDisks()
{
    if (!options_.scansSystemDisks)
        return;
    if (const auto watching = watch_.start(); !watching)
        host_.log().ov_log(contract::OVLog::error, 0, watching.error().message);
    scan_.start();
}

// A label means nothing before the disks have been read. Image files need not wait for that.
void DesktopSession::disksRead(const std::vector<DiskTree>& disks)
{
    host_.sharedDiskController().synchronize(disks);
    if (!std::exchange(hasReadDisks_, true))
        openNamed(false);
}

void DesktopSession::openNamed(bool areFiles)
{
    std::vector<std::string> names;
    std::copy_if(options_.disksToOpen.begin(), options_.disksToOpen.end(),
                 std::back_inserter(names), [=](const std::string& name) {
                     std::error_code ignored;
                     return std::filesystem::is_regular_file(name, ignored) == areFiles;
                 });
    images_.open(names);
}

// What the modules see as selected when the window is locked is what the job works on.
void DesktopSession::holdDisks()
{
    auto disks = window_.disks().selectedDisks();
    for (const auto& disk : controller_.allSelectedItemsFilterDuplicates(false, true))
        if (auto other = std::dynamic_pointer_cast<Disk>(disk))
            disks.push_back(std::move(other));
    host_.sharedDiskController().hold(std::move(disks));
}

void DesktopSession::releaseDisks()
{
    if (controller_.interfaceLock())
        return;  // the next job has begun
    if (host_.sharedDiskController().release()) {
        window_.disks().synchronize();
        selectionChanged();
    }
    const auto selected = window_.disks().selectedDisks();
    const bool mayHaveWritten = std::any_of(selected.begin(), selected.end(), [](const auto& disk) {
        return !ImageOpener::canEject(*disk);
    });
    // A label or a size may be another one. What a repair has written nobody need have told.
    if (mayHaveWritten && options_.scansSystemDisks)
        scan_.start();
}

}  // namespace orvane::desktop
