// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/window/DiskRow.h"
#include "orvane/support/disks/DiskController.h"

#include <QAbstractItemModel>
#include <QStringList>

#include <memory>
#include <set>
#include <string>
#include <vector>

namespace orvane::desktop {

/// The disks that the host knows, as a tree: whole disks and image files with their volumes. Where
/// there are both, each kind stands below a heading, a row that can be neither reached nor
/// selected. The rows follow the controller only when `synchronize` is called. Main thread.
class DiskTreeModel final : public QAbstractItemModel {
public:
    using DiskPointer = std::shared_ptr<Disk>;
    /// One line about what the disk is, of any column.
    static constexpr int DetailsRole = Qt::UserRole + 1;
    /// The same in fewer words.
    static constexpr int ShortDetailsRole = Qt::UserRole + 6;
    /// How far what is being done to the disk is, in per cent; 0 when nothing is, or it is not
    /// known.
    static constexpr int PercentRole = Qt::UserRole + 2;
    /// The two names of namesOf.
    static constexpr int NameRole = Qt::UserRole + 3;
    static constexpr int BearerRole = Qt::UserRole + 4;
    /// YES for a heading.
    static constexpr int HeadingRole = Qt::UserRole + 5;

    /// All outlive this object.
    DiskTreeModel(const DiskController& disks, DiskStates states, const Translator& texts);
    ~DiskTreeModel() override;

    /// Takes rows in and out where disks have come or gone, and shows the others as they are now.
    /// Rows that stay keep their selection.
    void synchronize();

    /// Shows how far the work on the disks is, and nothing else.
    void showProgress();

    /// Shows only disks of which searchText has all of these words, and what they are in. What was
    /// found stays as long as the words do: a disk does not vanish because it was repaired.
    void setFilter(const QString& words);
    bool isFiltered() const { return !words_.isEmpty(); }
    /// Also where none is shown.
    bool hasDisks() const { return !disks_.roots().empty(); }
    /// It would have a row if there were no filter.
    bool isKnown(const Disk& disk) const;

    /// What is shown of it; of a heading, nothing.
    const DiskRow& rowAt(const QModelIndex& index) const;
    /// What the disks inside it show, also those that are hidden.
    std::vector<DiskRow> partsOf(const Disk& disk) const;
    /// None for no row, and for a heading.
    DiskPointer diskAt(const QModelIndex& index) const;
    /// The row that shows the disk; invalid when there is none.
    QModelIndex indexOf(const std::string& identifier) const;

    QModelIndex index(int row, int column, const QModelIndex& parent = {}) const override;
    QModelIndex parent(const QModelIndex& child) const override;
    int rowCount(const QModelIndex& parent = {}) const override;
    int columnCount(const QModelIndex& parent = {}) const override;
    Qt::ItemFlags flags(const QModelIndex& index) const override;
    QVariant data(const QModelIndex& index, int role) const override;
    QVariant headerData(int section, Qt::Orientation orientation, int role) const override;

private:
    enum class Section { Disks, Images };
    /// What a row is about: a disk, or, where there is none, the heading of a section.
    struct Subject {
        DiskPointer disk;
        Section section = Section::Disks;

        friend bool operator==(const Subject&, const Subject&) = default;
    };
    using Subjects = std::vector<Subject>;
    struct Node;
    using Nodes = std::vector<std::unique_ptr<Node>>;

    const Node& nodeAt(const QModelIndex& index) const;
    DiskPointer contentsOf(const Disk& image) const;
    bool isContents(const Disk& disk) const;
    std::vector<DiskPointer> childrenOf(const Disk& disk) const;
    Subjects topSubjects();
    Subjects partsShown(const Disk& disk);
    bool isShown(const DiskPointer& disk);
    bool isFound(const DiskPointer& disk);
    void removeGone(Node& node, const QModelIndex& at, const Subjects& wanted);
    void showProgress(Node& node, const QModelIndex& at);
    void synchronize(Node& node, const QModelIndex& at, const Subjects& wanted);
    QVariant headingData(Section section, const QModelIndex& index, int role) const;
    DiskRow rowOf(const DiskPointer& disk) const;
    std::optional<LastCheck> ownCheckOf(const Disk& disk) const;
    std::optional<LastCheck> checkOf(const Disk& disk) const;
    std::string activityOf(const Disk& disk) const;

    const DiskController& disks_;
    const DiskStates states_;
    const Translator& texts_;
    std::unique_ptr<Node> top_;
    QStringList words_;
    std::set<std::string> found_;  ///< identifiers
};

}  // namespace orvane::desktop
