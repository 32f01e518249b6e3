// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/toolkit/OutlineView.h"

#include <QAbstractListModel>

namespace orvane::desktop {

/// The text of a record as the module's cell shows it; none for no record, or while the view has no
/// data source or no cell.
contract::StyledText textOfItem(contract::OutlineView& view, const contract::OutlineItem& item);
/// The text of the record in a row; none for a row that does not exist (any more).
contract::StyledText textOfRow(contract::OutlineView& view, std::size_t row);

/// A row that comes and goes with the details.
bool isDetail(const contract::OutlineItem& item);

/// The rows of an outline view without levels. Rows are asked for when they are shown: the model
/// keeps their number alone, so a million rows cost as much as one. Main thread.
class LogModel final : public QAbstractListModel {
public:
    /// The view whose data source is asked; it must live until it is taken away with none.
    void setView(contract::OutlineView* view);
    contract::OutlineView* view() const { return view_; }

    /// What is said before a row's text where its type is shown by its colour alone.
    struct SpokenTypes {
        QString problem;
        QString success;
    };
    void setSpokenTypes(SpokenTypes types) { spoken_ = std::move(types); }

    /// How the rows differ from those before.
    enum class Change { None, MoreAtEnd, MoreInFront, Other };
    /// Takes up the rows there are now. When there are only more of them at one end, the selection
    /// stays.
    Change reload();

    /// The record in a row, as the view answers it now; none for a row that it does not have.
    contract::OutlineItem itemAt(int row) const;

    int rowCount(const QModelIndex& parent = {}) const override;
    /// The row's plain text for Qt::DisplayRole, and with its type for Qt::AccessibleTextRole; the
    /// rest is the delegate's.
    QVariant data(const QModelIndex& index, int role) const override;
    Qt::ItemFlags flags(const QModelIndex& index) const override;

private:
    QString spokenText(const contract::OutlineItem& item) const;
    std::size_t countRows() const;
    Change changeTo(int rows) const;
    bool holdsOldRows(int offset) const;
    void remember(int rows);

    contract::OutlineView* view_ = nullptr;
    SpokenTypes spoken_;
    int rows_ = 0;
    contract::OutlineItem first_;  ///< as last loaded, to tell growth from another log
    contract::OutlineItem last_;
};

}  // namespace orvane::desktop
