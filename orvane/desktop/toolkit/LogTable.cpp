// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/LogTable.h"

#include "orvane/desktop/toolkit/LogDelegate.h"

#include <QApplication>
#include <QFontMetrics>
#include <QHeaderView>
#include <QMouseEvent>
#include <QScrollBar>

#include <algorithm>
#include <utility>

namespace orvane::desktop {
namespace {

constexpr int noteMargin = 24;       // pixels
constexpr int spaceBetweenRows = 2;  // pixels
constexpr int mostTries = 4;

}  // namespace

EmptyNote::EmptyNote(QAbstractItemView& view, const QString& hint)
    : QLabel(hint, view.viewport()), view_(view), hint_(hint)
{
    setTextFormat(Qt::PlainText);
    setWordWrap(true);
    setAlignment(Qt::AlignCenter);
    setMargin(noteMargin);
    setForegroundRole(QPalette::PlaceholderText);
    setAttribute(Qt::WA_TransparentForMouseEvents);
    view.viewport()->installEventFilter(this);
    const QAbstractItemModel* const model = view.model();
    connect(model, &QAbstractItemModel::rowsInserted, this, [this] { follow(); });
    connect(model, &QAbstractItemModel::rowsRemoved, this, [this] { follow(); });
    connect(model, &QAbstractItemModel::modelReset, this, [this] { follow(); });
    follow();
}

bool EmptyNote::eventFilter(QObject* /*watched*/, QEvent* event)
{
    if (event->type() == QEvent::Resize)
        follow();
    return false;
}

void EmptyNote::follow()
{
    setGeometry(view_.viewport()->rect());
    setVisible(view_.model()->rowCount() == 0);
}

LogTable::LogTable(QWidget* parent) : QTableView(parent)
{
    horizontalHeader()->hide();
    horizontalHeader()->setStretchLastSection(true);
    verticalHeader()->hide();
    verticalHeader()->setSectionResizeMode(QHeaderView::Fixed);
    verticalHeader()->setMinimumSectionSize(1);
    setShowGrid(false);
    setWordWrap(false);
    setCornerButtonEnabled(false);
    setTabKeyNavigation(false);
    setEditTriggers(NoEditTriggers);
    setSelectionBehavior(SelectRows);
    setSelectionMode(ExtendedSelection);
    setVerticalScrollMode(ScrollPerPixel);
    setHorizontalScrollBarPolicy(Qt::ScrollBarAlwaysOff);
    setAcceptDrops(false);
    setItemDelegate(new LogDelegate(this));
    adoptFont();
}

int LogTable::pixelsToEnd() const
{
    return verticalScrollBar()->maximum() - verticalScrollBar()->value();
}

// Rows that come into sight may need more room, and move what should be there.
template <class Place>
void LogTable::settleAt(Place place)
{
    for (int tries = 0; tries < mostTries; ++tries) {
        executeDelayedItemsLayout();
        updateGeometries();
        verticalScrollBar()->setValue(place());
        if (!fitRowsInSight())
            return;
    }
}

void LogTable::scrollToPixelsBeforeEnd(int pixels)
{
    settleAt([&] { return verticalScrollBar()->maximum() - pixels; });
}

void LogTable::putRowAt(int row, int top)
{
    settleAt([&] { return verticalScrollBar()->value() + rowViewportPosition(row) - top; });
}

bool LogTable::fitRowsInSight()
{
    QStyleOptionViewItem option;
    initViewItemOption(&option);
    option.rect = {0, 0, columnWidth(0), verticalHeader()->defaultSectionSize()};
    const int bottom = viewport()->height();
    bool hasChanged = false;
    for (int row = rowAt(0); row >= 0 && row < model()->rowCount(); ++row) {
        if (rowViewportPosition(row) >= bottom)
            break;
        const int height = itemDelegate()->sizeHint(option, model()->index(row, 0)).height();
        if (height == rowHeight(row))
            continue;
        verticalHeader()->resizeSection(row, height);
        hasChanged = true;
    }
    return hasChanged;
}

// What the user has scrolled to.
void LogTable::paintEvent(QPaintEvent* event)
{
    const bool isAtEnd = pixelsToEnd() == 0;
    if (fitRowsInSight() && isAtEnd)
        scrollToPixelsBeforeEnd(0);
    QTableView::paintEvent(event);
}

// The end stays in sight when the pane above takes room.
void LogTable::resizeEvent(QResizeEvent* event)
{
    const bool wasAtEnd = pixelsToEnd() == 0;
    QTableView::resizeEvent(event);
    if (wasAtEnd)
        scrollToPixelsBeforeEnd(0);
}

void LogTable::keyPressEvent(QKeyEvent* event)
{
    if (handlers_.keyDown)
        handlers_.keyDown(*event);
    else
        handleKey(*event);
}

// Dragging a selected row drags the selection; dragging any other selects rows.
void LogTable::mousePressEvent(QMouseEvent* event)
{
    const QModelIndex index = indexAt(event->position().toPoint());
    setDragEnabled(isDraggable_ && index.isValid() && selectionModel()->isSelected(index));
    const bool isPlain = event->button() == Qt::LeftButton && event->modifiers() == Qt::NoModifier;
    pressed_ = isPlain ? QPersistentModelIndex(index) : QPersistentModelIndex();
    QTableView::mousePressEvent(event);
}

// A row that is dragged, or over which rows are selected, is not clicked.
void LogTable::mouseReleaseEvent(QMouseEvent* event)
{
    QTableView::mouseReleaseEvent(event);
    const QPersistentModelIndex pressed = std::exchange(pressed_, QPersistentModelIndex());
    if (pressed.isValid() && pressed == indexAt(event->position().toPoint()) && handlers_.clicked)
        handlers_.clicked(pressed.row());
}

void LogTable::mouseDoubleClickEvent(QMouseEvent* event)
{
    mousePressEvent(event);
}

void LogTable::setSearched(const QString& text)
{
    if (std::exchange(searched_, text) != text)
        viewport()->update();
}

void LogTable::startDrag(Qt::DropActions /*supported*/)
{
    pressed_ = QPersistentModelIndex();
    if (handlers_.drag)
        handlers_.drag();
}

void LogTable::changeEvent(QEvent* event)
{
    QTableView::changeEvent(event);
    if (event->type() == QEvent::FontChange || event->type() == QEvent::StyleChange)
        adoptFont();
}

void LogTable::adoptFont()
{
    QFont bold = font();
    bold.setBold(true);
    verticalHeader()->setDefaultSectionSize(QFontMetrics(bold).height() + spaceBetweenRows);
}

}  // namespace orvane::desktop
