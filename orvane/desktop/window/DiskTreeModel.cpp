// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/DiskTreeModel.h"

#include "contract/pellar/MessageKeys.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/desktop/window/DiskRow.h"

#include <algorithm>

namespace orvane::desktop {
namespace {

bool isImageContents(const Disk& disk)
{
    return disk.facts().storage == contract::DiskReference::Storage::FileRegion &&
           !disk.isOfflineDiskImage();
}

/// What is good is 0, and what is known to be bad is worse than what is not known.
int badness(const Check& check)
{
    if (check.verdict == contract::kPLVerdictSound.text() ||
        check.verdict == contract::kPLVerdictRepaired.text())
        return 0;
    return check.verdict == contract::kPLVerdictDamaged.text() ? 2 : 1;
}

/// None while something is done to the disk: its verdict is not shown then.
QIcon stateIcon(const DiskRow& row)
{
    if (!row.activity.empty() || (row.lastCheck && row.lastCheck->isPartial))
        return {};
    if (row.lastCheck)
        return verdictIcon(row.lastCheck->told.verdict);
    return row.note.empty() ? QIcon() : verdictIcon("");
}

}  // namespace

struct DiskTreeModel::Node {
    DiskPointer disk;
    DiskRow row;
    Node* parent = nullptr;
    Nodes children;

    int position() const
    {
        const auto& siblings = parent->children;
        const auto found = std::find_if(siblings.begin(), siblings.end(),
                                        [this](const auto& node) { return node.get() == this; });
        return static_cast<int>(found - siblings.begin());
    }
};

DiskTreeModel::DiskTreeModel(const DiskController& disks, DiskStates states,
                             const Translator& texts)
    : disks_(disks), states_(std::move(states)), texts_(texts), top_(std::make_unique<Node>())
{
}

DiskTreeModel::~DiskTreeModel() = default;

DiskTreeModel::DiskPointer DiskTreeModel::contentsOf(const Disk& image) const
{
    const auto& roots = disks_.roots();
    const auto found = std::find_if(roots.begin(), roots.end(), [&](const DiskPointer& root) {
        return isImageContents(*root) && root->facts().path == image.facts().imagePath;
    });
    return found != roots.end() ? *found : nullptr;
}

bool DiskTreeModel::isContents(const Disk& disk) const
{
    const auto& roots = disks_.roots();
    return isImageContents(disk) &&
           std::any_of(roots.begin(), roots.end(), [&](const DiskPointer& root) {
               return root->isOfflineDiskImage() && root->facts().imagePath == disk.facts().path;
           });
}

// The whole disk of an image is the image to the user, and so is a volume that fills it.
std::vector<DiskTreeModel::DiskPointer> DiskTreeModel::childrenOf(const Disk& disk) const
{
    const DiskPointer contents = disk.isOfflineDiskImage() ? contentsOf(disk) : nullptr;
    std::vector<DiskPointer> children = contents ? contents->parts() : disk.parts();
    std::erase_if(children, [](const DiskPointer& child) { return !child->facts().isShown; });
    return children;
}

std::vector<DiskTreeModel::DiskPointer> DiskTreeModel::rootsShown() const
{
    std::vector<DiskPointer> roots = disks_.roots();
    std::erase_if(roots, [this](const DiskPointer& root) { return isContents(*root); });
    return roots;
}

DiskRow DiskTreeModel::rowOf(const DiskPointer& disk) const
{
    DiskRow row{disk->facts(), disk->facts().label, disk->facts().filesystem, checkOf(*disk)};
    row.activity = activityOf(*disk);
    if (!row.activity.empty())
        row.percent = states_.percent();
    row.note = states_.note(*disk);
    if (const DiskPointer contents = disk->isOfflineDiskImage() ? contentsOf(*disk) : nullptr) {
        row.label = contents->facts().label;
        row.filesystem = contents->facts().filesystem;
        row.facts.space = contents->facts().space;
    }
    return row;
}

// What was said of an image file itself concerns an attempt that did not get at its contents.
std::optional<LastCheck> DiskTreeModel::ownCheckOf(const Disk& disk) const
{
    auto own = states_.lastCheck(disk);
    const DiskPointer contents = disk.isOfflineDiskImage() ? contentsOf(disk) : nullptr;
    auto inside = contents ? states_.lastCheck(*contents) : std::nullopt;
    if (!own || !inside)
        return own ? own : inside;
    const Check& last = inside->later ? *inside->later : inside->told;
    if (own->told.started > last.started)
        inside->later = own->told;
    return inside;
}

// The worst there is, the disk's own before its parts'.
std::optional<LastCheck> DiskTreeModel::checkOf(const Disk& disk) const
{
    auto worst = ownCheckOf(disk);
    bool isPartial = false;
    for (const DiskPointer& child : childrenOf(disk)) {
        auto check = checkOf(*child);
        isPartial = isPartial || !check || check->isPartial;
        if (!check || (worst && badness(worst->told) >= badness(check->told)))
            continue;
        if (check->part.empty())
            check->part = child->displayName();
        worst = std::move(check);
    }
    if (worst)
        worst->isPartial = isPartial && badness(worst->told) == 0;
    return worst;
}

std::string DiskTreeModel::activityOf(const Disk& disk) const
{
    std::string activity = states_.activity(disk);
    const DiskPointer contents = disk.isOfflineDiskImage() ? contentsOf(disk) : nullptr;
    if (activity.empty() && contents)
        activity = states_.activity(*contents);
    for (const DiskPointer& child : childrenOf(disk))
        if (activity.empty())
            activity = activityOf(*child);
    return activity;
}

void DiskTreeModel::synchronize()
{
    synchronize(*top_, {}, rootsShown());
}

void DiskTreeModel::showProgress()
{
    showProgress(*top_, {});
}

void DiskTreeModel::showProgress(Node& node, const QModelIndex& at)
{
    for (std::size_t i = 0; i < node.children.size(); ++i) {
        Node& child = *node.children[i];
        const QModelIndex place = index(static_cast<int>(i), 0, at);
        if (!child.row.activity.empty()) {
            child.row.percent = states_.percent();
            emit dataChanged(place, place);
        }
        showProgress(child, place);
    }
}

void DiskTreeModel::removeGone(Node& node, const QModelIndex& at,
                               const std::vector<DiskPointer>& wanted)
{
    for (int row = static_cast<int>(node.children.size()) - 1; row >= 0; --row) {
        const auto place = node.children.begin() + row;
        if (std::find(wanted.begin(), wanted.end(), (*place)->disk) != wanted.end())
            continue;
        beginRemoveRows(at, row, row);
        node.children.erase(place);
        endRemoveRows();
    }
}

void DiskTreeModel::synchronize(Node& node, const QModelIndex& at,
                                const std::vector<DiskPointer>& wanted)
{
    removeGone(node, at, wanted);
    for (std::size_t i = 0; i < wanted.size(); ++i) {
        const int row = static_cast<int>(i);
        const bool isThere = i < node.children.size() && node.children[i]->disk == wanted[i];
        if (!isThere) {
            auto added = std::make_unique<Node>();
            added->disk = wanted[i];
            added->row = rowOf(wanted[i]);
            added->parent = &node;
            beginInsertRows(at, row, row);
            node.children.insert(node.children.begin() + row, std::move(added));
            endInsertRows();
        } else {
            node.children[i]->row = rowOf(wanted[i]);
            emit dataChanged(index(row, 0, at), index(row, diskColumnCount - 1, at));
        }
        synchronize(*node.children[i], index(row, 0, at), childrenOf(*wanted[i]));
    }
    // Rows that have changed places stand here a second time.
    while (node.children.size() > wanted.size()) {
        const int last = static_cast<int>(node.children.size()) - 1;
        beginRemoveRows(at, last, last);
        node.children.pop_back();
        endRemoveRows();
    }
}

const DiskTreeModel::Node& DiskTreeModel::nodeAt(const QModelIndex& index) const
{
    return index.isValid() ? *static_cast<const Node*>(index.constInternalPointer()) : *top_;
}

DiskTreeModel::DiskPointer DiskTreeModel::diskAt(const QModelIndex& index) const
{
    return nodeAt(index).disk;
}

const DiskRow& DiskTreeModel::rowAt(const QModelIndex& index) const
{
    return nodeAt(index).row;
}

QModelIndex DiskTreeModel::indexOf(const std::string& identifier) const
{
    const QModelIndexList found = match(index(0, 0), Qt::UserRole, toQt(identifier), 1,
                                        Qt::MatchExactly | Qt::MatchRecursive | Qt::MatchWrap);
    return found.isEmpty() ? QModelIndex() : found.front();
}

QModelIndex DiskTreeModel::index(int row, int column, const QModelIndex& parent) const
{
    const Nodes& children = nodeAt(parent).children;
    if (row < 0 || row >= static_cast<int>(children.size()) || column < 0 ||
        column >= diskColumnCount)
        return {};
    return createIndex(row, column, children[static_cast<std::size_t>(row)].get());
}

QModelIndex DiskTreeModel::parent(const QModelIndex& child) const
{
    Node* const parent = nodeAt(child).parent;
    return parent == nullptr || parent == top_.get() ? QModelIndex()
                                                     : createIndex(parent->position(), 0, parent);
}

int DiskTreeModel::rowCount(const QModelIndex& parent) const
{
    return parent.column() > 0 ? 0 : static_cast<int>(nodeAt(parent).children.size());
}

int DiskTreeModel::columnCount(const QModelIndex& /*parent*/) const
{
    return diskColumnCount;
}

QVariant DiskTreeModel::data(const QModelIndex& index, int role) const
{
    if (!index.isValid())
        return {};
    const DiskRow& row = nodeAt(index).row;
    const auto column = static_cast<DiskColumn>(index.column());
    switch (role) {
        case Qt::DisplayRole: return cellText(row, column, texts_);
        case Qt::AccessibleTextRole:
            return column == DiskColumn::Name ? rowSummary(row, texts_)
                                              : cellText(row, column, texts_);
        case DetailsRole: return rowDetails(row, texts_);
        case PercentRole: return row.percent;
        case Qt::ToolTipRole: return toQtToolTip(fromQt(rowToolTip(row, texts_)));
        case Qt::UserRole: return toQt(row.facts.identifier);
        case Qt::DecorationRole:
            if (column == DiskColumn::Name)
                return diskIcon(row.facts);
            return column == DiskColumn::Verdict ? stateIcon(row) : QIcon();
        case Qt::TextAlignmentRole:
            return column == DiskColumn::Size ? QVariant(Qt::AlignRight | Qt::AlignVCenter)
                                              : QVariant();
        default: return {};
    }
}

QVariant DiskTreeModel::headerData(int section, Qt::Orientation orientation, int role) const
{
    if (orientation != Qt::Horizontal || role != Qt::DisplayRole)
        return {};
    return columnTitle(static_cast<DiskColumn>(section), texts_);
}

}  // namespace orvane::desktop
