// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/disks/Disk.h"

#include "fixwell/host/foundation/Dictionary.h"

#include <algorithm>
#include <utility>

namespace orvane {
namespace {

using fixwell::Array;
using fixwell::Value;

fixwell::DiskReferencePointer referenceTo(const DiskFacts& facts)
{
    fixwell::DiskReference reference;
    reference.storage = facts.storage;
    reference.path = facts.path;
    reference.offset = facts.offset;
    reference.length = facts.length;
    reference.identifier = facts.identifier;
    reference.name = facts.displayName;
    reference.filesystem = facts.filesystem;
    reference.mountPoint = facts.mountPoint;
    reference.isWhole = facts.isWhole;
    return std::make_shared<const fixwell::DiskReference>(std::move(reference));
}

bool isSameRecord(const Value& a, const Value& b)
{
    return a.dictionary().isSameAs(b.dictionary());
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
    reference_ = referenceTo(facts_);
    filesystem_.reset();
    if (!facts_.filesystem.empty())
        filesystem_.emplace(facts_.filesystem, surroundings_.capabilities);
}

// Without a path, so that an operation on it is refused with a reason. The node may be another
// disk's by now.
void Disk::setGone()
{
    DiskFacts nothing = facts_;
    nothing.path.clear();
    nothing.mountPoint.clear();
    facts_.mountPoint.clear();
    reference_ = referenceTo(nothing);
    hasGone_ = true;
}

void Disk::setParts(std::vector<std::shared_ptr<Disk>> parts)
{
    children_ = std::move(parts);
    for (const auto& child : children_)
        child->parent_ = weak_from_this();
}

std::vector<std::shared_ptr<fixwell::OVDisk>> Disk::children() const
{
    return {children_.begin(), children_.end()};
}

const fixwell::OVFilesystem* Disk::filesystem() const
{
    return filesystem_ ? &*filesystem_ : nullptr;
}

Array Disk::fsckHistoryNoChildren() const
{
    if (!own_)
        own_ = surroundings_.histories != nullptr ? surroundings_.histories->historyOf(facts_)
                                                  : Array::make();
    return own_;
}

bool Disk::Part::isCurrent(const Array& other) const
{
    return history.isSameAs(other) && size == other.size() && isSameRecord(first, other.front()) &&
           isSameRecord(last, other.back());
}

std::vector<std::shared_ptr<Disk>> Disk::inside() const
{
    std::vector<std::shared_ptr<Disk>> disks = children_;
    if (contents_)
        disks.push_back(contents_);
    return disks;
}

void Disk::collectHistories(std::vector<Array>& histories) const
{
    histories.push_back(fsckHistoryNoChildren());
    for (const auto& disk : inside())
        disk->collectHistories(histories);
}

// The log asks for the history with every row it draws, so a merged list is kept as long as
// nothing has been added to its parts.
Array Disk::fsckHistory() const
{
    std::vector<Array> histories;
    collectHistories(histories);
    if (histories.size() == 1)
        return histories.front();

    const bool isCurrent =
        merged_ &&
        std::equal(mergedFrom_.begin(), mergedFrom_.end(), histories.begin(), histories.end(),
                   [](const Part& part, const Array& history) { return part.isCurrent(history); });
    if (isCurrent)
        return merged_;
    merged_ = Array::make();
    mergedFrom_.clear();
    for (const Array& history : histories) {
        merged_.append(history);
        mergedFrom_.push_back({history, history.size(), history.front(), history.back()});
    }
    return merged_;
}

void Disk::setFsckHistory(const Array& history)
{
    own_ = history ? history : Array::make();
    if (surroundings_.histories != nullptr)
        surroundings_.histories->replaceHistoryOf(facts_, own_);
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
