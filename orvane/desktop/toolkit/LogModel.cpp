// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/LogModel.h"

#include "contract/pellar/MessageKeys.h"
#include "orvane/desktop/toolkit/StyledLine.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/support/history/RunStart.h"

#include <algorithm>
#include <limits>

namespace orvane::desktop {
namespace {

using Clock = std::chrono::steady_clock;

// A log of some hundred thousand rows is known at once, and no one waits longer for a longer one.
constexpr std::chrono::milliseconds firstLook{4};
constexpr int rowsBetweenTimes = 512;

bool isProblem(const contract::OutlineItem& item)
{
    const std::string_view type = item.string(contract::kFsckMessageType);
    return type == contract::kFsckError.text() || type == contract::kFsckFail.text() ||
           type == contract::kFsckProblem.text();
}

bool isSuccess(const contract::OutlineItem& item)
{
    return item.string(contract::kFsckMessageType) == contract::kFsckSuccess.text();
}

}  // namespace

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

QString textOf(const RunNote& note)
{
    QStringList parts{note.details, note.verdict};
    parts.removeAll(QString());
    return parts.join(QStringLiteral(", "));
}

contract::StyledText withNote(const contract::StyledText& heading, const RunNote& note)
{
    const QString known = textOf(note);
    if (known.isEmpty() || !heading)
        return heading;
    std::string_view title = heading.characters();
    title = title.substr(0, title.find_last_not_of('\n') + 1);
    contract::TextStyle style;
    style.font = heading.style().font;
    contract::StyledText text = contract::StyledText::make(title, style);
    text.append(" (" + fromQt(known) + ")\n");
    return text;
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
    if (change == Change::MoreAtEnd)
        growTo(rows);
    else if (change == Change::Other)
        beginAgain(rows);
    return change;
}

void LogModel::growTo(int rows)
{
    for (int row = rows_; row < rows; ++row) {
        const contract::OutlineItem item = viewItem(row);
        const LogRuns::Row kind = kindOf(item);
        // What the user sees going on is not folded when the next begins.
        const auto last = kind == LogRuns::Row::Heading ? runs_.lastHeading() : std::nullopt;
        if (last && runs_.isOpen(*last))
            choose(viewItem(*last), true);
        runs_.addAtEnd(kind, true);
    }
    remember(rows);
    if (const int shown = runs_.shownRows(); shown > shown_) {
        beginInsertRows({}, shown_, shown - 1);
        shown_ = shown;
        endInsertRows();
    }
}

void LogModel::beginAgain(int rows)
{
    const bool isSameLog = rows > 0 && rows_ > 0 &&
                           (viewItem(0).isSameAs(first_) || viewItem(rows - 1).isSameAs(last_));
    if (!isSameLog)
        choices_.clear();
    beginResetModel();
    runs_.begin(rows, filter_);
    remember(rows);
    look(firstLook);
    shown_ = runs_.shownRows();
    endResetModel();
}

void LogModel::look(std::chrono::milliseconds budget)
{
    const Clock::time_point end = Clock::now() + budget;
    while (runs_.unknown() > 0 && Clock::now() < end)
        for (int i = 0; i < rowsBetweenTimes && runs_.unknown() > 0; ++i) {
            const contract::OutlineItem item = viewItem(runs_.unknown() - 1);
            const LogRuns::Row kind = kindOf(item);
            runs_.addInFront(kind, kind == LogRuns::Row::Heading && isOpenAtFirst(item));
        }
}

bool LogModel::lookOn(std::chrono::milliseconds budget)
{
    if (runs_.unknown() == 0)
        return false;
    const int first = shown_ > 0 ? runs_.rowAt(0) : runs_.rows();
    look(budget);
    const int shown = runs_.shownRows();
    const int added = shown - shown_;
    const bool isOnlyInFront = shown_ == 0 || runs_.shownAt(first) == added;
    if (!isOnlyInFront) {
        beginResetModel();
        shown_ = shown;
        endResetModel();
    } else if (added > 0) {
        beginInsertRows({}, 0, added - 1);
        shown_ = shown;
        endInsertRows();
    }
    return runs_.unknown() > 0;
}

void LogModel::setFilter(LogRuns::Filter filter)
{
    if (std::exchange(filter_, filter) != filter)
        beginAgain(rows_);
}

LogRuns::Row LogModel::kindOf(const contract::OutlineItem& item) const
{
    if (isStartOfRun(item))
        return LogRuns::Row::Heading;
    const bool isKept =
        filter_ == LogRuns::Filter::KeptRows && (isProblem(item) || isSuccess(item));
    return isKept ? LogRuns::Row::Kept : LogRuns::Row::Other;
}

bool LogModel::isOpenAtFirst(const contract::OutlineItem& start) const
{
    for (const auto& [chosen, isOpen] : choices_)
        if (chosen.isSameAs(start))
            return isOpen;
    const bool isLast = !runs_.lastHeading();
    return isLast || (knowledge_.isNewest && knowledge_.isNewest(start));
}

void LogModel::choose(const contract::OutlineItem& start, bool isOpen)
{
    const auto chosen =
        std::find_if(choices_.begin(), choices_.end(),
                     [&start](const Choice& choice) { return choice.first.isSameAs(start); });
    if (chosen != choices_.end())
        chosen->second = isOpen;
    else
        choices_.emplace_back(start, isOpen);
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
    if (rows < rows_ || !holdsOldRows())
        return Change::Other;
    return rows == rows_ ? Change::None : Change::MoreAtEnd;
}

contract::OutlineItem LogModel::viewItem(int row) const
{
    return view_ != nullptr ? view_->itemAtRow(static_cast<std::size_t>(row))
                            : contract::OutlineItem();
}

contract::OutlineItem LogModel::itemAt(int shown) const
{
    return shown >= 0 && shown < shown_ ? viewItem(runs_.rowAt(shown)) : contract::OutlineItem();
}

// Records are only ever added to a history, or replaced altogether: where the first and the last
// of the old rows are what they were and none was added between, so are the others. Where one of
// several histories grows in front of another, one of the two has moved.
bool LogModel::holdsOldRows() const
{
    return viewItem(0).isSameAs(first_) && viewItem(rows_ - 1).isSameAs(last_);
}

void LogModel::remember(int rows)
{
    rows_ = rows;
    first_ = rows > 0 ? viewItem(0) : contract::OutlineItem();
    last_ = rows > 0 ? viewItem(rows - 1) : contract::OutlineItem();
}

bool LogModel::isHeading(int shown) const
{
    return shown >= 0 && shown < shown_ && runs_.isHeading(runs_.rowAt(shown));
}

std::optional<int> LogModel::headingOf(int shown) const
{
    const auto heading = runs_.headingOf(runs_.rowAt(shown));
    return heading ? runs_.shownAt(*heading) : std::nullopt;
}

void LogModel::setOpen(int shown, bool isOpen)
{
    const int heading = runs_.rowAt(shown);
    if (runs_.isOpen(heading) == isOpen)
        return;
    choose(viewItem(heading), isOpen);
    const int under = runs_.rowsUnder(heading);
    if (under > 0 && isOpen)
        beginInsertRows({}, shown + 1, shown + under);
    else if (under > 0)
        beginRemoveRows({}, shown + 1, shown + under);
    runs_.setOpen(heading, isOpen);
    shown_ = runs_.shownRows();
    if (under > 0 && isOpen)
        endInsertRows();
    else if (under > 0)
        endRemoveRows();
    emit dataChanged(index(shown), index(shown));
}

std::optional<int> LogModel::reveal(int viewRow)
{
    const auto heading = runs_.headingOf(viewRow);
    const auto shownHeading = heading ? runs_.shownAt(*heading) : std::nullopt;
    if (shownHeading && *heading != viewRow)
        setOpen(*shownHeading, true);
    return runs_.shownAt(viewRow);
}

RunNote LogModel::noteAt(int shown) const
{
    return knowledge_.noteOf && isHeading(shown) ? knowledge_.noteOf(itemAt(shown)) : RunNote();
}

contract::StyledText LogModel::notedText(int viewRow) const
{
    if (view_ == nullptr)
        return {};
    const contract::OutlineItem item = viewItem(viewRow);
    const contract::StyledText text = textOfItem(*view_, item);
    return knowledge_.noteOf && isStartOfRun(item) ? withNote(text, knowledge_.noteOf(item)) : text;
}

int LogModel::rowCount(const QModelIndex& parent) const
{
    return parent.isValid() ? 0 : shown_;
}

QVariant LogModel::data(const QModelIndex& index, int role) const
{
    if (!index.isValid() || view_ == nullptr)
        return {};
    switch (role) {
        case Qt::DisplayRole: return oneLine(textOfItem(*view_, itemAt(index.row()))).text;
        case Qt::AccessibleTextRole: return spokenText(index.row());
        default: return {};
    }
}

QString LogModel::spokenText(int shown) const
{
    const contract::OutlineItem item = itemAt(shown);
    QStringList parts{oneLine(textOfItem(*view_, item)).text};
    if (isHeading(shown)) {
        const RunNote note = noteAt(shown);
        parts << note.details << note.verdict << (isOpen(shown) ? spoken_.open : spoken_.closed);
        parts.removeAll(QString());
        return parts.join(QStringLiteral(", "));
    }
    const QString word = isProblem(item)   ? spoken_.problem
                         : isSuccess(item) ? spoken_.success
                                           : QString();
    return word.isEmpty() ? parts.front() : word + QStringLiteral(": ") + parts.front();
}

Qt::ItemFlags LogModel::flags(const QModelIndex& index) const
{
    if (!index.isValid())
        return Qt::NoItemFlags;
    return Qt::ItemIsEnabled | Qt::ItemIsSelectable | Qt::ItemIsDragEnabled |
           Qt::ItemNeverHasChildren;
}

}  // namespace orvane::desktop
