// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/DiskTreeModel.h"

#include "contract/pellar/MessageKeys.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/desktop/window/DiskRow.h"
#include "orvane/support/disks/FormatName.h"

#include <algorithm>
#include <array>

namespace orvane::desktop {
namespace {

bool isImageContents(const Disk& disk)
{
    return disk.facts().storage == contract::DiskReference::Storage::FileRegion &&
           !disk.isOfflineDiskImage();
}

std::string formatOf(const Disk& disk)
{
    return formatName(disk.facts().filesystem, disk.facts().filesystemVersion);
}

/// What is good is 0, and what is known to be bad is worse than what is not known.
int badness(const Check& check)
{
    if (isGood(check.verdict))
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
    Subject subject;
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

// The system's disks, then the images; each section has a heading where there are both.
DiskTreeModel::Subjects DiskTreeModel::topSubjects()
{
    std::array<Subjects, 2> sections;
    std::array<bool, 2> isThere{};
    for (const DiskPointer& root : disks_.roots()) {
        if (isContents(*root))
            continue;
        const auto section = root->facts().storage == contract::DiskReference::Storage::FileRegion
                                 ? Section::Images
                                 : Section::Disks;
        const auto place = static_cast<std::size_t>(section);
        isThere[place] = true;
        if (isShown(root))
            sections[place].push_back({root, section});
    }
    Subjects all;
    for (const Section section : {Section::Disks, Section::Images}) {
        const Subjects& disks = sections[static_cast<std::size_t>(section)];
        if (isThere[0] && isThere[1] && !disks.empty())
            all.push_back({nullptr, section});
        all.insert(all.end(), disks.begin(), disks.end());
    }
    return all;
}

DiskTreeModel::Subjects DiskTreeModel::partsShown(const Disk& disk)
{
    Subjects parts;
    for (DiskPointer& child : childrenOf(disk))
        if (isShown(child))
            parts.push_back({std::move(child)});
    return parts;
}

bool DiskTreeModel::isShown(const DiskPointer& disk)
{
    if (!isFiltered() || isFound(disk))
        return true;
    const auto children = childrenOf(*disk);
    return std::ranges::any_of(children, [this](const auto& child) { return isShown(child); });
}

bool DiskTreeModel::isFound(const DiskPointer& disk)
{
    if (found_.contains(disk->facts().identifier))
        return true;
    const QString text = searchText(rowOf(disk), texts_);
    const bool hasAll = std::ranges::all_of(
        words_, [&](const QString& word) { return text.contains(word, Qt::CaseInsensitive); });
    if (hasAll)
        found_.insert(disk->facts().identifier);
    return hasAll;
}

void DiskTreeModel::setFilter(const QString& words)
{
    words_ = words.split(QLatin1Char(' '), Qt::SkipEmptyParts);
    found_.clear();
    synchronize();
}

bool DiskTreeModel::isKnown(const Disk& disk) const
{
    const DiskPointer known = disks_.diskNamed(disk.facts().identifier);
    return known && !isContents(*known);
}

std::vector<DiskRow> DiskTreeModel::partsOf(const Disk& disk) const
{
    std::vector<DiskRow> rows;
    for (const DiskPointer& child : childrenOf(disk))
        rows.push_back(rowOf(child));
    return rows;
}

DiskRow DiskTreeModel::rowOf(const DiskPointer& disk) const
{
    DiskRow row{disk->facts(), disk->facts().label, formatOf(*disk), checkOf(*disk)};
    row.activity = activityOf(*disk);
    if (!row.activity.empty())
        row.percent = states_.percent();
    row.note = states_.note(*disk);
    row.nextCheck = states_.nextCheck(*disk);
    if (const DiskPointer contents = disk->isOfflineDiskImage() ? contentsOf(*disk) : nullptr) {
        row.label = contents->facts().label;
        row.format = formatOf(*contents);
        row.facts.space = contents->facts().space;
        row.facts.uuid = contents->facts().uuid;
        row.facts.partitionMap = contents->facts().partitionMap;
        row.facts.hasDamagedMap = contents->facts().hasDamagedMap;
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
    synchronize(*top_, {}, topSubjects());
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

void DiskTreeModel::removeGone(Node& node, const QModelIndex& at, const Subjects& wanted)
{
    for (int row = static_cast<int>(node.children.size()) - 1; row >= 0; --row) {
        const auto place = node.children.begin() + row;
        if (std::find(wanted.begin(), wanted.end(), (*place)->subject) != wanted.end())
            continue;
        beginRemoveRows(at, row, row);
        node.children.erase(place);
        endRemoveRows();
    }
}

void DiskTreeModel::synchronize(Node& node, const QModelIndex& at, const Subjects& wanted)
{
    const auto rowFor = [this](const Subject& subject) {
        return subject.disk ? rowOf(subject.disk) : DiskRow();
    };
    removeGone(node, at, wanted);
    for (std::size_t i = 0; i < wanted.size(); ++i) {
        const int row = static_cast<int>(i);
        const bool isThere = i < node.children.size() && node.children[i]->subject == wanted[i];
        if (!isThere) {
            auto added = std::make_unique<Node>();
            added->subject = wanted[i];
            added->row = rowFor(wanted[i]);
            added->parent = &node;
            beginInsertRows(at, row, row);
            node.children.insert(node.children.begin() + row, std::move(added));
            endInsertRows();
        } else {
            node.children[i]->row = rowFor(wanted[i]);
            emit dataChanged(index(row, 0, at), index(row, diskColumnCount - 1, at));
        }
        if (wanted[i].disk)
            synchronize(*node.children[i], index(row, 0, at), partsShown(*wanted[i].disk));
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
    return nodeAt(index).subject.disk;
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

// What is disabled is passed over by the keys, too.
Qt::ItemFlags DiskTreeModel::flags(const QModelIndex& index) const
{
    return index.isValid() && !diskAt(index) ? Qt::NoItemFlags : QAbstractItemModel::flags(index);
}

QVariant DiskTreeModel::headingData(Section section, const QModelIndex& index, int role) const
{
    if (role == HeadingRole)
        return true;
    const bool isText = role == Qt::DisplayRole || role == Qt::AccessibleTextRole;
    if (!isText || index.column() != static_cast<int>(DiskColumn::Name))
        return {};
    return toQt(texts_.text(section == Section::Disks ? "Disks" : "Disk Images"));
}

QVariant DiskTreeModel::data(const QModelIndex& index, int role) const
{
    if (!index.isValid())
        return {};
    const Node& node = nodeAt(index);
    if (!node.subject.disk)
        return headingData(node.subject.section, index, role);
    const DiskRow& row = node.row;
    const auto column = static_cast<DiskColumn>(index.column());
    switch (role) {
        case Qt::DisplayRole: return cellText(row, column, texts_);
        case Qt::AccessibleTextRole:
            return column == DiskColumn::Name ? rowSummary(row, texts_)
                                              : cellText(row, column, texts_);
        case DetailsRole: return rowDetails(row, texts_);
        case ShortDetailsRole: return rowDetails(row, texts_, true);
        case PercentRole: return row.percent;
        case NameRole: return namesOf(row).name;
        case BearerRole: return namesOf(row).bearer;
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
