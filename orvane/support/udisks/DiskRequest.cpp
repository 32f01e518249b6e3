// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/udisks/DiskRequest.h"

#include <algorithm>

namespace orvane {
namespace {

bool isVolume(const Disk& disk)
{
    const std::int32_t type = disk.diskType();
    return type == diskType::volume || type == diskType::bareVolume ||
           type == diskType::assembled || type == diskType::opticalDisc;
}

std::shared_ptr<Disk> wholeOf(const Disk& disk)
{
    auto whole = std::dynamic_pointer_cast<Disk>(disk.parentDisk());
    while (whole && whole->parentDisk())
        whole = std::dynamic_pointer_cast<Disk>(whole->parentDisk());
    return whole;
}

bool holdsSystem(const Disk& disk)
{
    const auto& parts = disk.parts();
    return disk.isBootVolume() || std::any_of(parts.begin(), parts.end(),
                                              [](const auto& part) { return holdsSystem(*part); });
}

bool canMount(const Disk& disk)
{
    return isVolume(disk) && !disk.facts().filesystem.empty() && !disk.isMounted();
}

bool canEject(const Disk& disk)
{
    const auto whole = wholeOf(disk);
    const Disk& top = whole ? *whole : disk;
    return top.facts().isEjectable && !holdsSystem(top);
}

void unmountParts(const Disk& disk, std::vector<DiskStep>& steps)
{
    for (const auto& part : disk.parts())
        unmountParts(*part, steps);
    if (disk.isMounted())
        steps.push_back({DiskStep::Kind::Unmount, disk.facts().path});
}

bool isLoop(const DiskFacts& facts)
{
    return facts.path.filename().native().starts_with("loop");
}

DiskRequest ejectionOf(const Disk& whole)
{
    DiskRequest request{DiskAction::Eject, whole.diskIdentifier(), whole.displayName(), {}};
    unmountParts(whole, request.steps);
    request.steps.push_back(
        {isLoop(whole.facts()) ? DiskStep::Kind::DetachLoop : DiskStep::Kind::Eject,
         whole.facts().path});
    return request;
}

}  // namespace

bool isPossible(DiskAction action, const Disk& disk)
{
    if (disk.hasGone() || disk.facts().storage != fixwell::DiskReference::Storage::BlockDevice)
        return false;
    switch (action) {
        case DiskAction::Mount: return canMount(disk);
        case DiskAction::Unmount: return disk.isMounted() && !disk.isBootVolume();
        case DiskAction::Eject: return canEject(disk);
    }
    return false;
}

DiskRequest requestFor(DiskAction action, const Disk& disk)
{
    const auto whole = wholeOf(disk);
    if (action == DiskAction::Eject)
        return ejectionOf(whole ? *whole : disk);
    const auto kind = action == DiskAction::Mount ? DiskStep::Kind::Mount : DiskStep::Kind::Unmount;
    return {action, disk.diskIdentifier(), disk.displayName(), {{kind, disk.facts().path}}};
}

std::string failureText(const DiskRequest& request, const Refusal& refusal, const Translator& texts)
{
    const std::string reason = reasonText(refusal, texts);
    switch (request.action) {
        case DiskAction::Mount:
            return texts.sentence("cannot mount “%@”: %@", {request.name, reason});
        case DiskAction::Unmount:
            return texts.sentence("cannot unmount “%@”: %@", {request.name, reason});
        case DiskAction::Eject: break;
    }
    return texts.sentence("cannot eject “%@”: %@", {request.name, reason});
}

}  // namespace orvane
