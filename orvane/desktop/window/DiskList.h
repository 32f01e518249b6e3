// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/window/DiskTreeModel.h"

#include <QTreeView>

#include <functional>
#include <vector>

namespace orvane::desktop {

/// The list in which the user selects disks. Main thread.
class DiskList final : public QTreeView {
public:
    using DiskPointer = DiskTreeModel::DiskPointer;

    explicit DiskList(const Translator& texts, QWidget* parent = nullptr);

    /// Once; the model must live as long as the list. `selectionChanged` is called after every
    /// change of the user's, and not by `synchronize`.
    void show(DiskTreeModel& disks, std::function<void()> selectionChanged);

    /// In the list's order, each once.
    std::vector<DiskPointer> selectedDisks() const;
    /// What is shown of them, in the same order.
    std::vector<DiskRow> selectedRows() const;
    /// What is shown of the disks inside a disk of the list.
    std::vector<DiskRow> rowsBelow(const DiskRow& row) const;
    /// Selects this disk alone, and brings it into sight.
    void select(const Disk& disk);
    /// Has rows taken in and out without telling of the selection.
    void synchronize();
    /// Shows how far the work on the disks is.
    void showProgress();

private:
    QModelIndexList selectionInOrder() const;

    DiskTreeModel* disks_ = nullptr;
    bool isSynchronizing_ = false;
};

}  // namespace orvane::desktop
