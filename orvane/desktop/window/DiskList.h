// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/window/DiskTreeModel.h"
#include "orvane/desktop/window/ListNote.h"

#include <QTreeView>

#include <functional>
#include <vector>

namespace orvane::desktop {

/// The list in which the user selects disks. Main thread.
class DiskList final : public QTreeView {
public:
    using DiskPointer = DiskTreeModel::DiskPointer;

    /// What the user asks for in the list.
    struct Events {
        std::function<void()> opened;     ///< a disk, by Return or a double click
        std::function<void()> openImage;  ///< where the list is empty
        std::function<void()> search;     ///< "/"
        /// The filter is in the way.
        std::function<void()> clearFilter;
    };

    explicit DiskList(const Translator& texts, QWidget* parent = nullptr);
    Events& events() { return events_; }

    /// Once; the model must live as long as the list. `selectionChanged` is called after every
    /// change of the user's, and not by `synchronize`.
    void show(DiskTreeModel& disks, std::function<void()> selectionChanged);

    /// In the list's order, each once.
    std::vector<DiskPointer> selectedDisks() const;
    /// What is shown of them, in the same order.
    std::vector<DiskRow> selectedRows() const;
    /// What is known of the disks inside a disk of the list.
    std::vector<DiskRow> rowsBelow(const DiskRow& row) const;
    /// Selects this disk alone, and brings it into sight, out of a filter as well.
    void select(const Disk& disk);
    void selectFirst();
    /// Has rows taken in and out without telling of the selection.
    void synchronize();
    /// Shows how far the work on the disks is.
    void showProgress();
    /// As of the model; what is hidden is not selected any more.
    void setFilter(const QString& words);
    /// The system's disks are being looked for, and none is known yet.
    void setLooking(bool isLooking);

protected:
    void keyPressEvent(QKeyEvent* event) override;

private:
    QModelIndexList selectionInOrder() const;
    void tellWhatIsMissing();

    const Translator& texts_;
    DiskTreeModel* disks_ = nullptr;
    ListNote* note_;
    Events events_;
    std::function<void()> selectionChanged_;
    QString filter_;
    bool isSynchronizing_ = false;
    bool isLooking_ = false;
};

}  // namespace orvane::desktop
