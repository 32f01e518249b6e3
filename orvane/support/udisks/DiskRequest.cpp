// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/udisks/DiskRequest.h"

#include "contract/foundation/UTF8.h"

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

std::optional<Refusal> because(Refusal::Kind kind)
{
    return Refusal{kind, {}};
}

std::optional<Refusal> objectionToMounting(const Disk& disk)
{
    if (disk.isMounted())
        return because(Refusal::Kind::AlreadySo);
    if (!isVolume(disk) && !disk.parts().empty())
        return because(Refusal::Kind::IsWhole);
    return disk.facts().filesystem.empty() ? because(Refusal::Kind::NoFilesystem) : std::nullopt;
}

std::optional<Refusal> objectionToUnmounting(const Disk& disk)
{
    if (disk.isBootVolume())
        return because(Refusal::Kind::HoldsSystem);
    if (disk.isMounted())
        return std::nullopt;
    return because(disk.parts().empty() ? Refusal::Kind::AlreadySo : Refusal::Kind::IsWhole);
}

std::optional<Refusal> objectionToEjection(const Disk& top)
{
    if (holdsSystem(top))
        return because(Refusal::Kind::HoldsSystem);
    return top.facts().isEjectable ? std::nullopt : because(Refusal::Kind::CannotEject);
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

DiskRequest ejectionOf(DiskAction action, const Disk& whole)
{
    DiskRequest request{action, whole.diskIdentifier(), whole.displayName(), {}};
    unmountParts(whole, request.steps);
    request.steps.push_back(
        {isLoop(whole.facts()) ? DiskStep::Kind::DetachLoop : DiskStep::Kind::Eject,
         whole.facts().path});
    return request;
}

}  // namespace

std::optional<Refusal> objectionTo(DiskAction action, const Disk& disk)
{
    if (disk.hasGone())
        return because(Refusal::Kind::HasGone);
    if (disk.facts().storage != contract::DiskReference::Storage::BlockDevice)
        return because(action == DiskAction::Detach ? Refusal::Kind::IsNoLoop
                                                    : Refusal::Kind::IsImage);
    const auto whole = wholeOf(disk);
    const Disk& top = whole ? *whole : disk;
    switch (action) {
        case DiskAction::Mount: return objectionToMounting(disk);
        case DiskAction::Unmount: return objectionToUnmounting(disk);
        case DiskAction::Eject: return objectionToEjection(top);
        case DiskAction::Attach: break;
        case DiskAction::Detach:
            return isLoop(top.facts()) ? objectionToEjection(top)
                                       : because(Refusal::Kind::IsNoLoop);
    }
    return because(Refusal::Kind::AlreadySo);
}

DiskRequest requestFor(DiskAction action, const Disk& disk)
{
    const auto whole = wholeOf(disk);
    if (action == DiskAction::Eject || action == DiskAction::Detach)
        return ejectionOf(action, whole ? *whole : disk);
    const auto kind = action == DiskAction::Mount ? DiskStep::Kind::Mount : DiskStep::Kind::Unmount;
    return {action, disk.diskIdentifier(), disk.displayName(), {{kind, disk.facts().path}}};
}

DiskRequest requestToAttach(const std::filesystem::path& image)
{
    return {DiskAction::Attach,
            image.native(),
            contract::printable((image.has_filename() ? image.filename() : image).native()),
            {{DiskStep::Kind::Attach, image.native()}}};
}

namespace {

std::string_view attemptOf(DiskAction action)
{
    switch (action) {
        case DiskAction::Mount: return "cannot mount “%@”: %@";
        case DiskAction::Unmount: return "cannot unmount “%@”: %@";
        case DiskAction::Eject: return "cannot eject “%@”: %@";
        case DiskAction::Attach: return "cannot attach “%@” as a device: %@";
        case DiskAction::Detach: break;
    }
    return "cannot detach “%@”: %@";
}

}  // namespace

std::string failureText(const DiskRequest& request, const Refusal& refusal, const Translator& texts)
{
    return texts.sentence(attemptOf(request.action), {request.name, reasonText(refusal, texts)});
}

}  // namespace orvane
