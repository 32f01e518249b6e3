// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/LogTable.h"

#include <QEvent>
#include <QFontMetrics>
#include <QHeaderView>
#include <QMouseEvent>
#include <QScrollBar>

namespace orvane::desktop {
namespace {

constexpr int spaceBetweenRows = 2;  // pixels
constexpr int mostTries = 4;

}  // namespace

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
    adoptFont();
}

int LogTable::pixelsToEnd() const
{
    return verticalScrollBar()->maximum() - verticalScrollBar()->value();
}

// Rows that come into sight may need more room, and move what should be there.
void LogTable::scrollToPixelsBeforeEnd(int pixels)
{
    for (int tries = 0; tries < mostTries; ++tries) {
        executeDelayedItemsLayout();
        updateGeometries();
        verticalScrollBar()->setValue(verticalScrollBar()->maximum() - pixels);
        if (!fitRowsInSight())
            return;
    }
}

void LogTable::putRowAt(int row, int top)
{
    for (int tries = 0; tries < mostTries; ++tries) {
        executeDelayedItemsLayout();
        updateGeometries();
        verticalScrollBar()->setValue(verticalScrollBar()->value() + rowViewportPosition(row) -
                                      top);
        if (!fitRowsInSight())
            return;
    }
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
    QTableView::mousePressEvent(event);
}

void LogTable::startDrag(Qt::DropActions /*supported*/)
{
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
