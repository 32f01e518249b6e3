// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/disks/DiskController.h"

#include <algorithm>
#include <utility>

namespace orvane {
namespace {

using contract::OVDiskPointer;

bool isOfImage(const Disk& disk)
{
    return disk.facts().storage == contract::DiskReference::Storage::FileRegion;
}

bool isVolume(const Disk& disk)
{
    const std::int32_t type = disk.diskType();
    return type == diskType::volume || type == diskType::bareVolume || type == diskType::assembled;
}

// A name may be given to another device, as those of loop devices and sticks are.
bool isSameDisk(const DiskFacts& now, const DiskFacts& before)
{
    const bool isOther =
        now.sequence != before.sequence && now.sequence != 0 && before.sequence != 0;
    return now.identifier == before.identifier && !isOther;
}

void collect(const std::shared_ptr<Disk>& disk, std::vector<std::shared_ptr<Disk>>& all)
{
    all.push_back(disk);
    for (const auto& child : disk->parts())
        collect(child, all);
}

DiskTree treeOf(const Disk& disk)
{
    DiskTree tree{disk.facts(), {}};
    for (const auto& part : disk.parts())
        tree.children.push_back(treeOf(*part));
    return tree;
}

}  // namespace

std::vector<std::shared_ptr<Disk>> withParts(const std::shared_ptr<Disk>& disk)
{
    std::vector<std::shared_ptr<Disk>> all;
    collect(disk, all);
    return all;
}

DiskController::DiskController(contract::NotificationCenter& center,
                               Disk::Surroundings surroundings)
    : center_(center), surroundings_(std::move(surroundings))
{
}

std::shared_ptr<Disk> DiskController::find(const std::function<bool(const Disk&)>& isMeant) const
{
    for (const auto& root : roots_)
        for (const auto& disk : withParts(root))
            if (isMeant(*disk))
                return disk;
    return nullptr;
}

std::shared_ptr<Disk> DiskController::diskNamed(std::string_view identifier) const
{
    return find([=](const Disk& disk) { return disk.facts().identifier == identifier; });
}

std::shared_ptr<Disk> DiskController::add(const DiskFacts& facts)
{
    if (auto known = diskNamed(facts.identifier))
        return known;
    auto disk = std::make_shared<Disk>(facts, surroundings_);
    roots_.push_back(disk);
    appear(disk);
    return disk;
}

void DiskController::adopt(const DiskTree& top)
{
    adopt(Disk::make(top, surroundings_));
}

void DiskController::adopt(const std::shared_ptr<Disk>& top)
{
    const auto known = diskNamed(top->facts().identifier);
    if (known == top)
        return;
    const auto image = find([&](const Disk& disk) {
        return disk.isOfflineDiskImage() && disk.facts().imagePath == top->facts().path;
    });
    if (image)
        bringUpToDate(image, top->facts());
    if (known) {
        update(known, treeOf(*top));
        return;
    }
    if (image)
        image->setContents(top);
    roots_.push_back(top);
    appear(top);
}

void DiskController::bringUpToDate(const std::shared_ptr<Disk>& image, const DiskFacts& contents)
{
    DiskFacts facts = image->facts();
    facts.length = contents.length;
    facts.isWritable = contents.isWritable;
    if (facts == image->facts())
        return;
    image->setFacts(facts);
    post(contract::OVDiskChangedNotification, image);
}

void DiskController::post(contract::Name name, const std::shared_ptr<Disk>& disk)
{
    center_.post({name, disk, {}});
}

void DiskController::appear(const std::shared_ptr<Disk>& disk)
{
    for (const auto& part : withParts(disk))
        post(contract::OVDiskAppearedNotification, part);
}

// Of a disk that is worked on, everything above and below it is.
bool DiskController::isHeld(const std::shared_ptr<Disk>& disk) const
{
    const auto isOneOf = [](const std::shared_ptr<Disk>& wanted, const std::shared_ptr<Disk>& top) {
        const auto all = withParts(top);
        return std::find(all.begin(), all.end(), wanted) != all.end();
    };
    return std::any_of(held_.begin(), held_.end(), [&](const std::shared_ptr<Disk>& held) {
        return isOneOf(held, disk) || isOneOf(disk, held);
    });
}

// The parts are told before the whole, and each once.
void DiskController::tellGone(const std::shared_ptr<Disk>& top)
{
    auto gone = withParts(top);
    std::reverse(gone.begin(), gone.end());
    for (const auto& disk : gone)
        if (!disk->hasGone()) {
            disk->setGone();
            post(contract::OVDiskEjectedNotification, disk);
        }
}

// First forgotten, then told: an observer must not find the disk any more.
void DiskController::forget(const std::shared_ptr<Disk>& root)
{
    if (!isHeld(root))
        std::erase(roots_, root);
    forgetAsked();
    tellGone(root);
}

void DiskController::hold(std::vector<std::shared_ptr<Disk>> disks)
{
    held_ = std::move(disks);
    mountedWhenHeld_.clear();
    for (const auto& disk : held_)
        for (const auto& part : withParts(disk))
            if (part->isMounted())
                mountedWhenHeld_.insert(part->facts().identifier);
}

bool DiskController::release()
{
    held_.clear();
    forgetAsked();
    const auto hasGone = [](const std::shared_ptr<Disk>& disk) {
        return disk->hasGone();
    };
    bool hasForgotten = std::erase_if(roots_, hasGone) > 0;
    for (const auto& root : roots_)
        for (const auto& disk : withParts(root)) {
            auto parts = disk->parts();
            if (std::erase_if(parts, hasGone) == 0)
                continue;
            disk->setParts(std::move(parts));
            hasForgotten = true;
        }
    return hasForgotten;
}

void DiskController::synchronize(const std::vector<DiskTree>& systemDisks)
{
    forgetAsked();
    const auto previous = roots_;
    for (const auto& root : previous) {
        const bool isThere = std::any_of(
            systemDisks.begin(), systemDisks.end(),
            [&](const DiskTree& tree) { return isSameDisk(tree.facts, root->facts()); });
        if (!isOfImage(*root) && !isThere)
            forget(root);
    }
    for (const DiskTree& tree : systemDisks) {
        if (const auto known = diskNamed(tree.facts.identifier)) {
            update(known, tree);
        } else {
            roots_.push_back(Disk::make(tree, surroundings_));
            appear(roots_.back());
        }
    }
}

/// The parts of a disk that is read again, in the order in which they were read.
struct DiskController::PartsReadAgain {
    std::vector<std::shared_ptr<Disk>> now;
    std::vector<std::shared_ptr<Disk>> made;  ///< those that were not known
    std::vector<std::shared_ptr<Disk>> gone;
};

DiskController::PartsReadAgain DiskController::readAgain(const Disk& disk,
                                                         const std::vector<DiskTree>& trees) const
{
    PartsReadAgain parts;
    parts.gone = disk.parts();
    for (const DiskTree& tree : trees) {
        const auto known = std::find_if(
            parts.gone.begin(), parts.gone.end(),
            [&](const auto& part) { return part->facts().identifier == tree.facts.identifier; });
        if (known != parts.gone.end()) {
            parts.now.push_back(*known);
            parts.gone.erase(known);
        } else {
            parts.made.push_back(Disk::make(tree, surroundings_));
            parts.now.push_back(parts.made.back());
        }
    }
    return parts;
}

void DiskController::update(const std::shared_ptr<Disk>& disk, const DiskTree& tree)
{
    if (disk->hasGone())
        return;
    const bool wasMounted = disk->isMounted();
    const bool isOther = disk->facts() != tree.facts;
    disk->setFacts(tree.facts);
    const PartsReadAgain parts = readAgain(*disk, tree.children);
    auto all = parts.now;
    std::copy_if(parts.gone.begin(), parts.gone.end(), std::back_inserter(all),
                 [this](const auto& part) { return isHeld(part); });
    disk->setParts(std::move(all));

    if (isOther)
        post(wasMounted && !disk->isMounted() ? contract::OVDiskUnmountedNotification
                                              : contract::OVDiskChangedNotification,
             disk);
    for (const auto& part : parts.gone)
        tellGone(part);
    for (std::size_t i = 0; i < parts.now.size(); ++i)
        if (std::find(parts.made.begin(), parts.made.end(), parts.now[i]) == parts.made.end())
            update(parts.now[i], tree.children[i]);
    for (const auto& part : parts.made)
        appear(part);
}

OVDiskPointer DiskController::diskWithIdentifier(std::string_view identifier)
{
    return diskNamed(identifier);
}

std::shared_ptr<Disk> DiskController::diskReferredTo(
    const contract::DiskReferencePointer& reference)
{
    if (!reference)
        return nullptr;
    if (reference != askedReference_) {
        asked_ = diskNamed(reference->identifier);
        askedReference_ = asked_ ? reference : nullptr;
    }
    return asked_;
}

void DiskController::forgetAsked()
{
    asked_.reset();
    askedReference_.reset();
}

OVDiskPointer DiskController::diskWithKRDisk(const contract::DiskReferencePointer& disk)
{
    return diskReferredTo(disk);
}

OVDiskPointer DiskController::findOrCreateOVDisk(const contract::DiskReferencePointer& disk)
{
    if (!disk)
        return nullptr;
    if (const auto known = diskReferredTo(disk))
        return known;
    return add({*disk, disk->isWhole ? diskType::whole : diskType::volume});
}

std::vector<OVDiskPointer> DiskController::viewablePartitions(const OVDiskPointer& disk)
{
    const auto top = std::dynamic_pointer_cast<Disk>(disk);
    if (!top)
        return {};
    adopt(top);
    std::vector<OVDiskPointer> volumes;
    for (const auto& part : withParts(top))
        if (part->facts().isShown && isVolume(*part))
            volumes.push_back(part);
    return volumes;
}

void DiskController::warn(const Result<void, Failure>& outcome)
{
    if (!outcome && hooks_.warn)
        hooks_.warn(outcome.error().message);
}

void DiskController::mountDisk(const OVDiskPointer& disk, bool includeChildren,
                               bool /*synchronous*/)
{
    const auto top = std::dynamic_pointer_cast<Disk>(disk);
    if (!top || !hooks_.mount)
        return;
    for (const auto& part : includeChildren ? withParts(top) : std::vector{top})
        if (mountedWhenHeld_.contains(part->facts().identifier) && !part->isMounted())
            warn(hooks_.mount(*part));
}

void DiskController::ejectDisk(const OVDiskPointer& disk, bool /*synchronous*/)
{
    const auto top = std::dynamic_pointer_cast<Disk>(disk);
    if (!top)
        return;
    if (isOfImage(*top)) {
        if (std::find(roots_.begin(), roots_.end(), top) != roots_.end())
            forget(top);
    } else if (hooks_.eject) {
        warn(hooks_.eject(*top));
    }
}

void DiskController::notifyFrontmostModulesOnly(contract::Name name,
                                                const contract::Notification& notification)
{
    if (hooks_.notifyFrontmost)
        hooks_.notifyFrontmost(name, notification);
}

}  // namespace orvane
