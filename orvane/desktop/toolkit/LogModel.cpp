// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/LogModel.h"

#include "contract/pellar/MessageKeys.h"
#include "orvane/desktop/toolkit/StyledLine.h"

#include <algorithm>
#include <limits>

namespace orvane::desktop {

contract::StyledText textOfItem(contract::OutlineView& view, const contract::OutlineItem& item)
{
    contract::BrowserCell* const cell = view.dataCell();
    if (cell == nullptr || view.dataSource() == nullptr || !item)
        return {};
    view.dataSource()->outlineViewWillDisplayCellForTableColumnItem(*cell, item);
    return cell->attributedStringValue();
}

contract::StyledText textOfRow(contract::OutlineView& view, std::size_t row)
{
    return textOfItem(view, view.itemAtRow(row));
}

bool isDetail(const contract::OutlineItem& item)
{
    return item.integer(contract::kFsckVerbosity) >= contract::verbosity::detail;
}

void LogModel::setView(contract::OutlineView* view)
{
    view_ = view;
    reload();
}

LogModel::Change LogModel::reload()
{
    const auto rows =
        static_cast<int>(std::min<std::size_t>(countRows(), std::numeric_limits<int>::max() / 64));
    const Change change = changeTo(rows);
    switch (change) {
        case Change::None: break;
        case Change::MoreAtEnd:
            beginInsertRows({}, rows_, rows - 1);
            remember(rows);
            endInsertRows();
            break;
        case Change::MoreInFront:
            beginInsertRows({}, 0, rows - rows_ - 1);
            remember(rows);
            endInsertRows();
            break;
        case Change::Other:
            beginResetModel();
            remember(rows);
            endResetModel();
            break;
    }
    return change;
}

std::size_t LogModel::countRows() const
{
    const bool hasSource = view_ != nullptr && view_->dataSource() != nullptr;
    return hasSource ? view_->dataSource()->outlineViewNumberOfChildrenOfItem({}) : 0;
}

LogModel::Change LogModel::changeTo(int rows) const
{
    if (rows_ == 0)
        return rows == 0 ? Change::None : Change::Other;
    if (rows < rows_)
        return Change::Other;
    if (holdsOldRows(0))
        return rows == rows_ ? Change::None : Change::MoreAtEnd;
    return holdsOldRows(rows - rows_) ? Change::MoreInFront : Change::Other;
}

contract::OutlineItem LogModel::itemAt(int row) const
{
    return view_ != nullptr && row >= 0 ? view_->itemAtRow(static_cast<std::size_t>(row))
                                        : contract::OutlineItem();
}

// Records are only ever added to a history, or replaced altogether: where the first and the last
// of the old rows are what they were and none was added between, so are the others. Where one of
// several histories grows in front of another, one of the two has moved.
bool LogModel::holdsOldRows(int offset) const
{
    return view_->itemAtRow(static_cast<std::size_t>(offset)).isSameAs(first_) &&
           view_->itemAtRow(static_cast<std::size_t>(offset + rows_ - 1)).isSameAs(last_);
}

void LogModel::remember(int rows)
{
    rows_ = rows;
    first_ = rows > 0 ? view_->itemAtRow(0) : contract::OutlineItem();
    last_ =
        rows > 0 ? view_->itemAtRow(static_cast<std::size_t>(rows - 1)) : contract::OutlineItem();
}

int LogModel::rowCount(const QModelIndex& parent) const
{
    return parent.isValid() ? 0 : rows_;
}

QVariant LogModel::data(const QModelIndex& index, int role) const
{
    if (!index.isValid() || view_ == nullptr)
        return {};
    const contract::OutlineItem item = view_->itemAtRow(static_cast<std::size_t>(index.row()));
    switch (role) {
        case Qt::DisplayRole: return oneLine(textOfItem(*view_, item)).text;
        case Qt::AccessibleTextRole: return spokenText(item);
        default: return {};
    }
}

QString LogModel::spokenText(const contract::OutlineItem& item) const
{
    const QString text = oneLine(textOfItem(*view_, item)).text;
    const std::string_view type = item.string(contract::kFsckMessageType);
    const bool isProblem =
        type == contract::kFsckError.text() || type == contract::kFsckFail.text();
    QString word;
    if (isProblem)
        word = spoken_.problem;
    else if (type == contract::kFsckSuccess.text())
        word = spoken_.success;
    return word.isEmpty() ? text : word + QStringLiteral(": ") + text;
}

Qt::ItemFlags LogModel::flags(const QModelIndex& index) const
{
    if (!index.isValid())
        return Qt::NoItemFlags;
    return Qt::ItemIsEnabled | Qt::ItemIsSelectable | Qt::ItemIsDragEnabled |
           Qt::ItemNeverHasChildren;
}

}  // namespace orvane::desktop
