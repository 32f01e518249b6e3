// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/LogPlace.h"

#include "contract/pellar/MessageKeys.h"

#include <algorithm>

namespace orvane::desktop {
namespace {

// As in fixwell/messagelog: rows from this verbosity on come and go with the details.
constexpr std::int64_t detailVerbosity = 1;

bool isThere(const LogModel& model, int number, const contract::OutlineItem& item)
{
    return number >= 0 && number < model.rowCount() && model.itemAt(number).isSameAs(item);
}

}  // namespace

LogPlace::LogPlace(const LogTable& table, const LogModel& model)
    : isAtEnd_(table.pixelsToEnd() == 0), rows_(model.rowCount())
{
    const auto rowAt = [&model](int number) {
        return Row{number, model.itemAt(number)};
    };
    const int first = table.rowAt(0);
    const int height = table.viewport()->height();
    for (int row = first; row >= 0 && row < rows_; ++row) {
        const int top = table.rowViewportPosition(row);
        if (top >= height)
            break;
        inSight_.push_back({rowAt(row), top});
    }
    // Where nothing but details is in sight, the line that they belong to stands in for them.
    for (int row = first; row >= 0; --row)
        if (model.itemAt(row).integer(contract::kFsckVerbosity) < detailVerbosity) {
            inSight_.push_back({rowAt(row), table.rowViewportPosition(first)});
            break;
        }
    for (const QItemSelectionRange& range : table.selectionModel()->selection())
        selected_.push_back({rowAt(range.top()), rowAt(range.bottom())});
    if (!table.currentIndex().isValid())
        return;
    current_ = rowAt(table.currentIndex().row());
    // It is the one that is read.
    const auto current = std::find_if(
        inSight_.begin(), inSight_.end(),
        [this](const SightedRow& sighted) { return sighted.row.number == current_->number; });
    if (current != inSight_.end())
        std::rotate(inSight_.begin(), current, current + 1);
}

// Where rows came in one place, a row is where it was or that much further down. Only where they
// came in several places, as details do, are all rows looked through.
std::optional<int> LogPlace::find(const LogModel& model, const Row& row) const
{
    if (!row.item)
        return std::nullopt;
    for (const int number : {row.number, row.number + model.rowCount() - rows_})
        if (isThere(model, number, row.item))
            return number;
    for (int number = 0; number < model.rowCount(); ++number)
        if (model.itemAt(number).isSameAs(row.item))
            return number;
    return std::nullopt;
}

void LogPlace::restoreSelection(LogTable& table, const LogModel& model) const
{
    QItemSelection selection;
    for (const Stretch& stretch : selected_) {
        const auto first = find(model, stretch.first);
        const auto last = first ? find(model, stretch.last) : std::nullopt;
        if (last && *first <= *last)
            selection.select(model.index(*first, 0), model.index(*last, 0));
    }
    const auto current = current_ ? find(model, *current_) : std::nullopt;
    if (current)
        table.selectionModel()->setCurrentIndex(model.index(*current, 0),
                                                QItemSelectionModel::NoUpdate);
    table.selectionModel()->select(selection, QItemSelectionModel::ClearAndSelect);
}

bool LogPlace::restoreSight(LogTable& table, const LogModel& model) const
{
    for (const SightedRow& sighted : inSight_)
        if (const auto row = find(model, sighted.row)) {
            table.putRowAt(*row, sighted.top);
            return true;
        }
    return false;
}

}  // namespace orvane::desktop
