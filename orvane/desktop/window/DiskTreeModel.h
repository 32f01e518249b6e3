// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/window/DiskRow.h"
#include "orvane/support/disks/DiskController.h"

#include <QAbstractItemModel>

#include <memory>
#include <vector>

namespace orvane::desktop {

/// The disks that the host knows, as a tree: whole disks and image files with their volumes. The
/// rows follow the controller only when `synchronize` is called. Main thread.
class DiskTreeModel final : public QAbstractItemModel {
public:
    using DiskPointer = std::shared_ptr<Disk>;
    /// One line about what the disk is, of any column.
    static constexpr int DetailsRole = Qt::UserRole + 1;
    /// How far what is being done to the disk is, in per cent; 0 when nothing is, or it is not
    /// known.
    static constexpr int PercentRole = Qt::UserRole + 2;

    /// All outlive this object.
    DiskTreeModel(const DiskController& disks, DiskStates states, const Translator& texts);
    ~DiskTreeModel() override;

    /// Takes rows in and out where disks have come or gone, and shows the others as they are now.
    /// Rows that stay keep their selection.
    void synchronize();

    /// Shows how far the work on the disks is, and nothing else.
    void showProgress();

    /// What is shown of it.
    const DiskRow& rowAt(const QModelIndex& index) const;
    /// None for no row.
    DiskPointer diskAt(const QModelIndex& index) const;
    /// The row that shows the disk; invalid when there is none.
    QModelIndex indexOf(const std::string& identifier) const;

    QModelIndex index(int row, int column, const QModelIndex& parent = {}) const override;
    QModelIndex parent(const QModelIndex& child) const override;
    int rowCount(const QModelIndex& parent = {}) const override;
    int columnCount(const QModelIndex& parent = {}) const override;
    QVariant data(const QModelIndex& index, int role) const override;
    QVariant headerData(int section, Qt::Orientation orientation, int role) const override;

private:
    struct Node;
    using Nodes = std::vector<std::unique_ptr<Node>>;

    const Node& nodeAt(const QModelIndex& index) const;
    DiskPointer contentsOf(const Disk& image) const;
    bool isContents(const Disk& disk) const;
    std::vector<DiskPointer> childrenOf(const Disk& disk) const;
    std::vector<DiskPointer> rootsShown() const;
    void removeGone(Node& node, const QModelIndex& at, const std::vector<DiskPointer>& wanted);
    void showProgress(Node& node, const QModelIndex& at);
    void synchronize(Node& node, const QModelIndex& at, const std::vector<DiskPointer>& wanted);
    DiskRow rowOf(const DiskPointer& disk) const;
    std::optional<LastCheck> ownCheckOf(const Disk& disk) const;
    std::optional<LastCheck> checkOf(const Disk& disk) const;
    std::string activityOf(const Disk& disk) const;

    const DiskController& disks_;
    const DiskStates states_;
    const Translator& texts_;
    std::unique_ptr<Node> top_;
};

}  // namespace orvane::desktop
