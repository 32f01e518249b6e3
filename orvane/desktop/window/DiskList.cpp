// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/DiskList.h"

#include "orvane/desktop/toolkit/Text.h"
#include "orvane/desktop/window/DiskDelegate.h"

#include <QHeaderView>

#include <algorithm>

namespace orvane::desktop {

DiskList::DiskList(const Translator& texts, QWidget* parent) : QTreeView(parent)
{
    setObjectName(QStringLiteral("diskList"));
    setAccessibleName(toQt(texts.text("Disks")));
    setAccessibleDescription(toQt(texts.text("Select the disks to verify or repair.")));
    setSelectionMode(ExtendedSelection);
    setSelectionBehavior(SelectRows);
    setUniformRowHeights(true);
    setEditTriggers(NoEditTriggers);
    setHeaderHidden(true);
    setItemDelegate(new DiskDelegate(this));
}

void DiskList::show(DiskTreeModel& disks, std::function<void()> selectionChanged)
{
    disks_ = &disks;
    setModel(&disks);
    // The others are drawn in the first one.
    for (int column = 1; column < diskColumnCount; ++column)
        setColumnHidden(column, true);
    // Volumes are what the user is here for.
    connect(&disks, &QAbstractItemModel::rowsInserted, this,
            [this](const QModelIndex& parent) { setExpanded(parent, true); });
    connect(selectionModel(), &QItemSelectionModel::selectionChanged, this,
            [this, changed = std::move(selectionChanged)] {
                if (!isSynchronizing_)
                    changed();
            });
}

std::vector<DiskList::DiskPointer> DiskList::selectedDisks() const
{
    if (selectionModel() == nullptr)
        return {};
    QModelIndexList rows = selectionModel()->selectedRows();
    // Which stands first: by the path of row numbers from the top.
    const auto path = [](QModelIndex index) {
        std::vector<int> numbers;
        for (; index.isValid(); index = index.parent())
            numbers.insert(numbers.begin(), index.row());
        return numbers;
    };
    std::sort(rows.begin(), rows.end(),
              [&](const QModelIndex& a, const QModelIndex& b) { return path(a) < path(b); });
    std::vector<DiskPointer> disks;
    for (const QModelIndex& row : rows)
        disks.push_back(disks_->diskAt(row));
    return disks;
}

void DiskList::select(const Disk& disk)
{
    const QModelIndex row = disks_ != nullptr ? disks_->indexOf(disk) : QModelIndex();
    if (row.isValid())
        setCurrentIndex(row);
}

void DiskList::synchronize()
{
    if (disks_ == nullptr)
        return;
    isSynchronizing_ = true;
    disks_->synchronize();
    isSynchronizing_ = false;
}

}  // namespace orvane::desktop
