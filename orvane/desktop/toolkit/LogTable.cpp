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

void LogTable::scrollToPixelsBeforeEnd(int pixels)
{
    executeDelayedItemsLayout();
    updateGeometries();
    verticalScrollBar()->setValue(verticalScrollBar()->maximum() - pixels);
}

void LogTable::putRowAt(int row, int top)
{
    executeDelayedItemsLayout();
    updateGeometries();
    verticalScrollBar()->setValue(verticalScrollBar()->value() + rowViewportPosition(row) - top);
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
