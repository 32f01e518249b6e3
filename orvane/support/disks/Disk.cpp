// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/disks/Disk.h"

#include "pellar/packages/InstalledSystem.h"

#include <algorithm>
#include <array>
#include <utility>

namespace orvane {
namespace {

using contract::Array;

/// Files on this kind of file system (as libblkid or the kernel names it) have owners of their own.
/// NO for an unknown one: Linux then makes an owner up for all of them (mount(8), "uid=").
bool hasOwners(std::string_view filesystemType)
{
    constexpr std::array<std::string_view, 13> types{
        "ext2",   "ext3", "ext4",     "xfs",      "btrfs", "f2fs",    "jfs",
        "nilfs2", "zfs",  "bcachefs", "reiserfs", "erofs", "squashfs"};
    return std::find(types.begin(), types.end(), filesystemType) != types.end();
}

}  // namespace

std::shared_ptr<Disk> Disk::make(const DiskTree& tree, const Surroundings& surroundings)
{
    auto disk = std::make_shared<Disk>(tree.facts, surroundings);
    std::vector<std::shared_ptr<Disk>> parts;
    for (const DiskTree& child : tree.children)
        parts.push_back(make(child, surroundings));
    disk->setParts(std::move(parts));
    return disk;
}

Disk::Disk(DiskFacts facts, Surroundings surroundings) : surroundings_(std::move(surroundings))
{
    setFacts(facts);
}

void Disk::setFacts(const DiskFacts& facts)
{
    // A disk that was formatted anew has another history. One that cannot be read for a moment has
    // no other.
    if (facts.uuid != facts_.uuid && !facts.uuid.empty() && surroundings_.histories != nullptr)
        own_ = {};
    facts_ = facts;
    reference_ = std::make_shared<const contract::DiskReference>(facts_);
    filesystem_.reset();
    if (!facts_.filesystem.empty())
        filesystem_ =
            std::make_unique<DiskFilesystem>(facts_.filesystem, surroundings_.capabilities);
}

// Without a path, so that an operation on it is refused with a reason. The node may be another
// disk's by now.
void Disk::setGone()
{
    facts_.mountPoint.clear();
    contract::DiskReference nothing = facts_;
    nothing.path.clear();
    reference_ = std::make_shared<const contract::DiskReference>(std::move(nothing));
    hasGone_ = true;
}

void Disk::setParts(std::vector<std::shared_ptr<Disk>> parts)
{
    children_ = std::move(parts);
    for (const auto& child : children_)
        child->parent_ = weak_from_this();
}

void Disk::setContents(std::shared_ptr<Disk> contents)
{
    contents_ = std::move(contents);
    if (contents_)
        contents_->image_ = weak_from_this();
}

std::shared_ptr<contract::OVDisk> Disk::parentDisk() const
{
    const auto parent = parent_.lock();
    const auto image = parent ? parent->image_.lock() : nullptr;
    return image ? image : parent;
}

std::vector<std::shared_ptr<contract::OVDisk>> Disk::children() const
{
    return {children_.begin(), children_.end()};
}

const contract::OVFilesystem* Disk::filesystem() const
{
    return filesystem_.get();
}

bool Disk::permissionsEnabled() const
{
    return isMounted() && hasOwners(facts_.filesystem);
}

// Asked anew each time: a system may be installed, or its database moved, while the disk stays.
bool Disk::canRepairPermissions() const
{
    return isMounted() &&
           pellar::installedSystemAt(facts_.mountPoint) != pellar::PackageDatabase::None;
}

Array Disk::fsckHistoryNoChildren() const
{
    HistoryKeeper* const keeper = surroundings_.histories;
    if (!own_ || (keeper != nullptr && ownRevision_ != keeper->revision())) {
        own_ = keeper != nullptr ? keeper->historyOf(facts_) : Array::make();
        ownRevision_ = keeper != nullptr ? keeper->revision() : 0;
    }
    return own_;
}

std::vector<std::shared_ptr<Disk>> Disk::inside() const
{
    std::vector<std::shared_ptr<Disk>> disks = children_;
    if (contents_)
        disks.push_back(contents_);
    return disks;
}

void Disk::collect(std::vector<const Disk*>& disks) const
{
    disks.push_back(this);
    for (const auto& disk : inside())
        disk->collect(disks);
}

Array Disk::fsckHistory() const
{
    std::vector<const Disk*> disks;
    collect(disks);
    std::vector<Array> histories;
    for (const Disk* disk : disks)
        histories.push_back(disk->fsckHistoryNoChildren());
    HistoryKeeper* const keeper = surroundings_.histories;
    return merged_.of(histories, [&](std::size_t i) {
        return keeper != nullptr ? &keeper->timesOf(disks[i]->facts_) : nullptr;
    });
}

void Disk::setFsckHistory(const Array& history)
{
    own_ = history ? history : Array::make();
    if (surroundings_.histories == nullptr)
        return;
    surroundings_.histories->replaceHistoryOf(facts_, own_);
    ownRevision_ = surroundings_.histories->revision();
}

// What is shown for the disk is what goes: its own records and those of the disks inside it.
bool Disk::clearFsckHistory()
{
    const Array own = fsckHistoryNoChildren();
    bool hasRemoved = !own.isEmpty();
    if (surroundings_.histories != nullptr)
        hasRemoved = surroundings_.histories->clearHistoryOf(facts_);
    own.removeAll();
    for (const auto& disk : inside())
        hasRemoved = disk->clearFsckHistory() || hasRemoved;
    return hasRemoved;
}

}  // namespace orvane
