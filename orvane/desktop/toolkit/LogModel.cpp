// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/LogModel.h"

#include "fixwell/host/pellar/MessageKeys.h"
#include "orvane/desktop/toolkit/StyledLine.h"

#include <algorithm>
#include <limits>

namespace orvane::desktop {

fixwell::StyledText textOfItem(fixwell::OutlineView& view, const fixwell::OutlineItem& item)
{
    fixwell::BrowserCell* const cell = view.dataCell();
    if (cell == nullptr || view.dataSource() == nullptr || !item)
        return {};
    view.dataSource()->outlineViewWillDisplayCellForTableColumnItem(*cell, item);
    return cell->attributedStringValue();
}

fixwell::StyledText textOfRow(fixwell::OutlineView& view, std::size_t row)
{
    return textOfItem(view, view.itemAtRow(row));
}

void LogModel::setView(fixwell::OutlineView* view)
{
    view_ = view;
    reload();
}

void LogModel::reload()
{
    const auto rows =
        static_cast<int>(std::min<std::size_t>(countRows(), std::numeric_limits<int>::max() / 64));
    if (hasOnlyGrown(rows)) {
        if (rows > rows_) {
            beginInsertRows({}, rows_, rows - 1);
            remember(rows);
            endInsertRows();
        }
        return;
    }
    beginResetModel();
    remember(rows);
    endResetModel();
}

std::size_t LogModel::countRows() const
{
    const bool hasSource = view_ != nullptr && view_->dataSource() != nullptr;
    return hasSource ? view_->dataSource()->outlineViewNumberOfChildrenOfItem({}) : 0;
}

// Records are only ever added to a history, or replaced altogether: where the first and the last
// of the old rows are what they were, so are those between.
bool LogModel::hasOnlyGrown(int rows) const
{
    if (rows_ == 0)
        return true;
    return rows >= rows_ && view_->itemAtRow(0).isSameAs(first_) &&
           view_->itemAtRow(static_cast<std::size_t>(rows_ - 1)).isSameAs(last_);
}

void LogModel::remember(int rows)
{
    rows_ = rows;
    first_ = rows > 0 ? view_->itemAtRow(0) : fixwell::OutlineItem();
    last_ =
        rows > 0 ? view_->itemAtRow(static_cast<std::size_t>(rows - 1)) : fixwell::OutlineItem();
}

int LogModel::rowCount(const QModelIndex& parent) const
{
    return parent.isValid() ? 0 : rows_;
}

QVariant LogModel::data(const QModelIndex& index, int role) const
{
    if (!index.isValid() || view_ == nullptr)
        return {};
    const fixwell::OutlineItem item = view_->itemAtRow(static_cast<std::size_t>(index.row()));
    switch (role) {
        case Qt::DisplayRole: return oneLine(textOfItem(*view_, item)).text;
        case Qt::AccessibleTextRole: return spokenText(item);
        default: return {};
    }
}

QString LogModel::spokenText(const fixwell::OutlineItem& item) const
{
    const QString text = oneLine(textOfItem(*view_, item)).text;
    const std::string_view type = item.string(fixwell::kFsckMessageType);
    const bool isProblem = type == fixwell::kFsckError.text() || type == fixwell::kFsckFail.text();
    QString word;
    if (isProblem)
        word = spoken_.problem;
    else if (type == fixwell::kFsckSuccess.text())
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
