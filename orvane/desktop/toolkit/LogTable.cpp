// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/LogTable.h"

#include "orvane/desktop/toolkit/LogModel.h"
#include "orvane/desktop/toolkit/StyledLine.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QApplication>
#include <QFontMetrics>
#include <QHeaderView>
#include <QHelpEvent>
#include <QMouseEvent>
#include <QPainter>
#include <QScrollBar>
#include <QStyledItemDelegate>
#include <QToolTip>

#include <algorithm>
#include <cmath>

namespace orvane::desktop {
namespace {

constexpr int noteMargin = 24;       // pixels
constexpr int spaceBetweenRows = 2;  // pixels
constexpr int mostTries = 4;

LineLooks looksOf(const QStyleOptionViewItem& option, const contract::Font& font)
{
    const bool isSelected = option.state.testFlag(QStyle::State_Selected);
    const auto group = !option.state.testFlag(QStyle::State_Enabled) ? QPalette::Disabled
                       : option.state.testFlag(QStyle::State_Active) ? QPalette::Active
                                                                     : QPalette::Inactive;
    LineLooks looks;
    looks.fontScale = desktopFontScale();
    looks.defaultFont = font;
    looks.textColor =
        option.palette.color(group, isSelected ? QPalette::HighlightedText : QPalette::Text);
    looks.background =
        option.palette.color(group, isSelected ? QPalette::Highlight : QPalette::Base);
    looks.keepsTextColor = isSelected;
    return looks;
}

/// None where there is nothing to show yet, or any more.
contract::OutlineView* viewOf(const QModelIndex& index)
{
    const auto* const model = static_cast<const LogModel*>(index.model());
    contract::OutlineView* const view = model != nullptr ? model->view() : nullptr;
    return view != nullptr && view->dataCell() != nullptr ? view : nullptr;
}

bool isSentence(const QModelIndex& index)
{
    return !isDetail(static_cast<const LogModel*>(index.model())->itemAt(index.row()));
}

/// For a LogModel. Paints a row of the log: the text of the module's cell, in the frame that the
/// module's view gives, in colours that are readable on the desktop's palette. What is shown
/// without details are sentences to be read, and take as many lines as they need; the lines that
/// tools print among the details are cut as the module says, and are whole in a tooltip.
class LogDelegate final : public QStyledItemDelegate {
public:
    using QStyledItemDelegate::QStyledItemDelegate;

    void paint(QPainter* painter, const QStyleOptionViewItem& option,
               const QModelIndex& index) const override;
    /// The option's rectangle has the row's width, and the height of a row of one line.
    QSize sizeHint(const QStyleOptionViewItem& option, const QModelIndex& index) const override;
    bool helpEvent(QHelpEvent* event, QAbstractItemView* view, const QStyleOptionViewItem& option,
                   const QModelIndex& index) override;
};

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

void LogDelegate::paint(QPainter* painter, const QStyleOptionViewItem& option,
                        const QModelIndex& index) const
{
    drawRowBackground(*painter, option);
    contract::OutlineView* const view = viewOf(index);
    if (view == nullptr)
        return;
    const auto row = static_cast<std::size_t>(index.row());
    const contract::Rect frame = view->frameOfCellAtColumnRow(0, row);
    const auto put = isSentence(index) ? drawWrapped : draw;
    put(*painter, QRectF(frame.x, frame.y, frame.width, frame.height),
        oneLine(textOfRow(*view, row)), looksOf(option, view->dataCell()->font()));
}

QSize LogDelegate::sizeHint(const QStyleOptionViewItem& option, const QModelIndex& index) const
{
    constexpr int mostLines = 12;  // a name may be as long as it likes
    contract::OutlineView* const view = viewOf(index);
    if (view == nullptr || !isSentence(index))
        return option.rect.size();
    const auto row = static_cast<std::size_t>(index.row());
    const StyledLine line = oneLine(textOfRow(*view, row));
    const LineLooks looks = looksOf(option, view->dataCell()->font());
    const double width = view->frameOfCellAtColumnRow(0, row).width;
    const QFontMetricsF metrics(widestFont(line, looks));
    if (metrics.horizontalAdvance(line.text) <= width)
        return option.rect.size();
    const double added = wrappedHeight(line, looks, width) - metrics.height();
    return {option.rect.width(),
            std::min(option.rect.height() * mostLines,
                     option.rect.height() + static_cast<int>(std::ceil(std::max(0.0, added))))};
}

bool LogDelegate::helpEvent(QHelpEvent* event, QAbstractItemView* table,
                            const QStyleOptionViewItem& option, const QModelIndex& index)
{
    contract::OutlineView* const view = viewOf(index);
    if (view == nullptr || event->type() != QEvent::ToolTip)
        return QStyledItemDelegate::helpEvent(event, table, option, index);
    const auto row = static_cast<std::size_t>(index.row());
    const StyledLine line = oneLine(textOfRow(*view, row));
    const QFontMetricsF metrics(widestFont(line, looksOf(option, view->dataCell()->font())));
    const bool isCut =
        !isSentence(index) &&
        fitted(line, metrics, view->frameOfCellAtColumnRow(0, row).width).text != line.text;
    QToolTip::showText(event->globalPos(), isCut ? toQtToolTip(fromQt(line.text)) : QString(),
                       table);
    return true;
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
