// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/OutlinePeer.h"

#include "orvane/desktop/toolkit/LogTable.h"
#include "orvane/desktop/toolkit/QtControls.h"
#include "orvane/desktop/toolkit/QtPasteboard.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QDrag>
#include <QKeyEvent>
#include <QMetaObject>
#include <QScopedValueRollback>

#include <algorithm>
#include <memory>
#include <numeric>
#include <utility>

namespace orvane::desktop {
namespace {

bool isThere(const LogModel& model, int number, const contract::OutlineItem& item)
{
    return number >= 0 && number < model.rowCount() && model.itemAt(number).isSameAs(item);
}

// Where an outline without indentation leaves room for the arrow of a row, and at its end.
constexpr double roomForArrow = 16;
constexpr double roomAtTheEnd = 4;

bool allows(contract::DragOperation mask, contract::DragOperation operation)
{
    return (static_cast<std::uint32_t>(mask) & static_cast<std::uint32_t>(operation)) != 0;
}

}  // namespace

LogPlace::LogPlace(const LogTable& table, const LogModel& model)
    : isAtEnd_(table.pixelsToEnd() == 0), rows_(model.rowCount())
{
    const auto rowAt = [&model](int number) {
        return Row{number, model.itemAt(number)};
    };
    if (!isAtEnd_)
        noteSight(table, model);
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

// At the end, where a flood of output is followed, none of this is needed.
void LogPlace::noteSight(const LogTable& table, const LogModel& model)
{
    const int first = table.rowAt(0);
    const int height = table.viewport()->height();
    for (int row = first; row >= 0 && row < rows_; ++row) {
        const int top = table.rowViewportPosition(row);
        if (top >= height)
            break;
        inSight_.push_back({{row, model.itemAt(row)}, top});
    }
    // Where nothing but details is in sight, the line that they belong to stands in for them.
    for (int row = first; row >= 0; --row)
        if (!isDetail(model.itemAt(row))) {
            inSight_.push_back({{row, model.itemAt(row)}, table.rowViewportPosition(first)});
            break;
        }
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

OutlinePeer::OutlinePeer(LogTable& table, std::function<void()> beforeRows)
    : table_(&table), beforeRows_(std::move(beforeRows)), scroller_(*table.verticalScrollBar())
{
    table.setModel(&model_);
    table.setHandlers({[this](QKeyEvent& event) { sendKey(event); }, [this] { drag(); },
                       [this](int row) {
                           if (model_.isHeading(row))
                               toggle(row);
                       }});
    QObject::connect(table.selectionModel(), &QItemSelectionModel::selectionChanged, &model_,
                     [this] {
                         if (!isOwnChange_)
                             selectedWhole_ = 0;
                     });
    look_.setInterval(0);
    QObject::connect(&look_, &QTimer::timeout, &model_, [this] { lookOn(); });
}

OutlinePeer::~OutlinePeer()
{
    if (table_)
        table_->setHandlers({});
}

void OutlinePeer::setView(contract::OutlineView* view)
{
    view_ = view;
    model_.setView(view);
    rows_ = static_cast<std::size_t>(model_.rowsOfView());
    look_.start();
}

void OutlinePeer::reloadData()
{
    const bool hasSource = view_ != nullptr && view_->dataSource() != nullptr;
    // Asked for their number, the source goes on to other rows.
    if (!mustReload_)
        place_ = LogPlace(*table_, model_);
    rows_ = hasSource ? view_->dataSource()->outlineViewNumberOfChildrenOfItem({}) : 0;
    mustReload_ = true;
    noteChange();
}

void OutlinePeer::noteChange()
{
    if (isWaiting_)
        return;
    isWaiting_ = true;
    // In the model's name: what is waiting goes away together with this object.
    QMetaObject::invokeMethod(
        &model_, [this] { flush(); }, Qt::QueuedConnection);
}

void OutlinePeer::flush()
{
    isWaiting_ = false;
    if (std::exchange(mustReload_, false)) {
        beforeRows_();
        reload();
        table_->viewport()->update();
    }
    const auto row = std::exchange(mustShow_, std::nullopt);
    if (std::exchange(mustShowEnd_, false))
        table_->scrollToPixelsBeforeEnd(0);
    else if (const auto shown = row ? model_.shownRow(static_cast<int>(*row)) : std::nullopt)
        table_->scrollTo(model_.index(*shown));
}

// Another log is shown from its end, where the last verdict stands. In one that goes on, who reads
// at its end is shown the new end, and who has scrolled up keeps the place.
void OutlinePeer::reload()
{
    const QScopedValueRollback own(isOwnChange_, true);
    const LogModel::Change change = model_.reload();
    rows_ = static_cast<std::size_t>(model_.rowsOfView());
    if (change == LogModel::Change::None)
        return;
    if (change == LogModel::Change::Other) {
        selectedWhole_ = 0;
        place_.restoreSelection(*table_, model_);
        keepPlace(place_);
        look_.start();
    } else if (place_.isAtEnd()) {
        table_->scrollToPixelsBeforeEnd(0);
    }
    if (rowsChanged_)
        rowsChanged_(change);
}

void OutlinePeer::keepPlace(const LogPlace& place)
{
    if (place.isAtEnd() || !place.restoreSight(*table_, model_))
        table_->scrollToPixelsBeforeEnd(0);
}

void OutlinePeer::lookOn()
{
    constexpr std::chrono::milliseconds budget{4};
    const LogPlace place(*table_, model_);
    const QScopedValueRollback own(isOwnChange_, true);
    const int before = model_.rowCount();
    if (!model_.lookOn(budget))
        look_.stop();
    if (model_.rowCount() == before)
        return;
    keepPlace(place);
    if (selectedWhole_ > 0)
        selectShownRows();
}

void OutlinePeer::setFilter(LogRuns::Filter filter)
{
    const LogPlace place(*table_, model_);
    model_.setFilter(filter);
    selectedWhole_ = 0;
    place.restoreSelection(*table_, model_);
    keepPlace(place);
    look_.start();
}

bool OutlinePeer::goTo(std::size_t row)
{
    const auto shown = model_.reveal(static_cast<int>(row));
    if (!shown)
        return false;
    const QModelIndex index = model_.index(*shown);
    table_->setCurrentIndex(index);
    table_->scrollTo(index, QAbstractItemView::EnsureVisible);
    return true;
}

void OutlinePeer::toggle(int shown)
{
    const bool wasAtEnd = table_->pixelsToEnd() == 0;
    const QScopedValueRollback own(isOwnChange_, true);
    model_.setOpen(shown, !model_.isOpen(shown));
    if (selectedWhole_ > 0)
        selectShownRows();
    // Where the table could not stay, the heading does.
    if (wasAtEnd)
        table_->scrollTo(model_.index(shown));
}

// As in a tree: towards the end side opens, towards the start side closes, or goes to the heading.
bool OutlinePeer::takeFoldingKey(const QKeyEvent& event)
{
    const int row = table_->currentIndex().row();
    if (row < 0 || (event.modifiers() & ~Qt::KeypadModifier) != Qt::NoModifier)
        return false;
    const bool isMirrored = table_->layoutDirection() == Qt::RightToLeft;
    const int opening = isMirrored ? Qt::Key_Left : Qt::Key_Right;
    const int closing = isMirrored ? Qt::Key_Right : Qt::Key_Left;
    const auto heading = event.key() == closing ? model_.headingOf(row) : std::nullopt;
    if (heading && *heading != row) {
        table_->setCurrentIndex(model_.index(*heading));
        return true;
    }
    if (!model_.isHeading(row))
        return false;
    const bool isOpen = model_.isOpen(row);
    const bool isToggle = event.key() == Qt::Key_Space || event.key() == Qt::Key_Return ||
                          event.key() == Qt::Key_Enter;
    if (isToggle || event.key() == (isOpen ? closing : opening))
        toggle(row);
    return isToggle || event.key() == opening || event.key() == closing;
}

std::string OutlinePeer::selectionHTML() const
{
    std::string result;
    for (const std::size_t row : selectedRowIndexes())
        result += html(model_.notedText(static_cast<int>(row)));
    return result;
}

std::string OutlinePeer::selectionText() const
{
    std::string result;
    for (const std::size_t row : selectedRowIndexes())
        result += model_.notedText(static_cast<int>(row)).characters();
    return result;
}

std::vector<std::size_t> OutlinePeer::selectedRowIndexes() const
{
    std::vector<std::size_t> rows(selectedWhole_);
    std::iota(rows.begin(), rows.end(), std::size_t{0});
    if (selectedWhole_ > 0)
        return rows;
    rows.reserve(numberOfSelectedRows());
    for (const QItemSelectionRange& range : table_->selectionModel()->selection())
        for (int row = range.top(); row <= range.bottom(); ++row)
            rows.push_back(static_cast<std::size_t>(model_.viewRow(row)));
    std::sort(rows.begin(), rows.end());
    return rows;
}

std::size_t OutlinePeer::numberOfSelectedRows() const
{
    std::size_t count = selectedWhole_;
    if (count > 0)
        return count;
    for (const QItemSelectionRange& range : table_->selectionModel()->selection())
        count += static_cast<std::size_t>(range.height());
    return count;
}

void OutlinePeer::scrollRowToVisible(std::size_t row)
{
    mustShow_ = row;
    // Rows that come until then make another one the last.
    mustShowEnd_ = row + 1 == rows_;
    noteChange();
}

contract::Rect OutlinePeer::rectOfRow(std::size_t row) const
{
    const auto shown = row < rows_ ? model_.shownRow(static_cast<int>(row)) : std::optional<int>();
    if (!shown)
        return {};
    const QRect rect = table_->visualRect(model_.index(*shown));
    return {static_cast<double>(rect.x()), static_cast<double>(rect.y()),
            static_cast<double>(rect.width()), static_cast<double>(rect.height())};
}

contract::Rect OutlinePeer::frameOfCellAtColumnRow(std::size_t /*column*/, std::size_t row) const
{
    contract::Rect frame = rectOfRow(row);
    if (frame == contract::Rect())
        return frame;
    frame.x += roomForArrow;
    frame.width = std::max(0.0, frame.width - roomForArrow - roomAtTheEnd);
    return frame;
}

contract::Rect OutlinePeer::frameOfOutlineCellAtRow(std::size_t row) const
{
    contract::Rect frame = rectOfRow(row);
    frame.width = std::min(frame.width, roomForArrow);
    return frame;
}

void OutlinePeer::sendKey(QKeyEvent& event)
{
    if (view_ == nullptr)
        table_->handleKey(event);
    else if (event.matches(QKeySequence::SelectAll))
        view_->selectAll(&table());
    else if (event.matches(QKeySequence::Copy) && view_->validateMenuItem({"copy:"}))
        view_->copy(&table());
    else if (event.key() == Qt::Key_Escape && escaped_)
        escaped_();
    else if (!event.matches(QKeySequence::Copy) && !takeFoldingKey(event))
        view_->keyDown({keyCodeOf(event.key()), modifierFlags(event.modifiers()), &event});
}

void OutlinePeer::keyDown(const contract::KeyEvent& event)
{
    if (event.native != nullptr)
        table_->handleKey(*static_cast<QKeyEvent*>(event.native));
}

void OutlinePeer::selectAll()
{
    flush();
    selectShownRows();
    if (model_.filter() == LogRuns::Filter::None)
        selectedWhole_ = rows_;
}

void OutlinePeer::selectShownRows()
{
    const QScopedValueRollback own(isOwnChange_, true);
    table_->selectAll();
}

void OutlinePeer::setNeedsDisplayInRect(const contract::Rect& rect)
{
    table_->viewport()->update(QRectF(rect.x, rect.y, rect.width, rect.height).toAlignedRect());
}

void OutlinePeer::setToolTip(std::string_view text)
{
    table_->setToolTip(toQtToolTip(text));
}

void OutlinePeer::setDraggingSourceOperationMask(contract::DragOperation mask, bool isLocal)
{
    (isLocal ? localMask_ : outsideMask_) = mask;
    table_->setDraggable(allows(localMask_, contract::DragOperation::Copy) ||
                         allows(outsideMask_, contract::DragOperation::Copy));
}

void OutlinePeer::drag()
{
    contract::OutlineViewDelegate* const source = view_ != nullptr ? view_->dataSource() : nullptr;
    if (source == nullptr ||
        !allows(source->draggingSourceOperationMaskForLocal(false), contract::DragOperation::Copy))
        return;
    std::vector<contract::OutlineItem> items;
    for (const std::size_t row : selectedRowIndexes())
        items.push_back(view_->itemAtRow(row));
    MimePasteboard pasteboard;
    if (!source->outlineViewWriteItemsToPasteboard(items, pasteboard))
        return;
    pasteboard.replaceText(selectionText());
    std::unique_ptr<QMimeData> data = pasteboard.take();
    data->setHtml(toQt(selectionHTML()));
    auto* const drag = new QDrag(table_);  // Qt deletes it when the drag is over
    drag->setMimeData(data.release());
    drag->exec(Qt::CopyAction);
}

}  // namespace orvane::desktop
