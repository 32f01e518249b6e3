// SPDX-License-Identifier: Apache-2.0
// How the selected disks are mounted, unmounted and ejected, and images attached.

#include "orvane/desktop/DesktopSession.h"

#include <algorithm>

namespace orvane::desktop {

std::vector<DiskRequest> DesktopSession::requestsFor(DiskAction action)
{
    std::vector<DiskRequest> requests;
    for (const auto& disk : window_.disks().selectedDisks())
        if (isPossible(action, *disk))
            requests.push_back(requestFor(action, *disk));
    std::erase_if(requests, [this](const DiskRequest& request) {
        return host_.diskOperations().isUnderWay(request.identifier);
    });
    return requests;
}

// While a job runs, the disks are its own.
bool DesktopSession::canDo(DiskAction action)
{
    if (controller_.interfaceLock())
        return false;
    const auto disks = window_.disks().selectedDisks();
    const bool holdsImage = std::any_of(
        disks.begin(), disks.end(), [](const auto& disk) { return ImageOpener::canEject(*disk); });
    return (action == DiskAction::Eject && holdsImage) || !requestsFor(action).empty();
}

// The list follows by itself; read anew all the same, for where the system cannot be watched.
void DesktopSession::carryOut(std::vector<DiskRequest> requests)
{
    host_.diskOperations().start(std::move(requests),
                                 [this](const std::vector<std::string>& failures) {
                                     showFailures(failures);
                                     if (options_.scansSystemDisks)
                                         scan_.start();
                                 });
}

void DesktopSession::attachAsDevices(const std::vector<std::string>& images)
{
    std::vector<DiskRequest> requests;
    for (const std::string& image : images)
        requests.push_back(requestToAttach(image));
    carryOut(std::move(requests));
}

void DesktopSession::doToSelection(DiskAction action)
{
    if (auto requests = requestsFor(action); !requests.empty())
        carryOut(std::move(requests));
    if (action == DiskAction::Eject)
        for (const auto& disk : window_.disks().selectedDisks())
            images_.eject(*disk);
}

MenuCommand DesktopSession::diskCommand(const char* objectName, std::string_view title,
                                        QKeySequence shortcut, DiskAction action)
{
    return {objectName, title, std::move(shortcut), [this, action] { doToSelection(action); },
            [this, action] {
                return canDo(action);
            }};
}

}  // namespace orvane::desktop
