// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/LogDelegate.h"

#include "contract/pellar/MessageKeys.h"
#include "orvane/desktop/toolkit/DesktopFont.h"
#include "orvane/desktop/toolkit/LogModel.h"
#include "orvane/desktop/toolkit/StyledLine.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QAbstractItemView>
#include <QApplication>
#include <QHelpEvent>
#include <QPainter>
#include <QToolTip>

#include <algorithm>
#include <cmath>

namespace orvane::desktop {
namespace {

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

// As in fixwell/messagelog: rows from this verbosity on come with the details.
bool isSentence(const QModelIndex& index)
{
    constexpr std::int64_t detailVerbosity = 1;
    const auto* const model = static_cast<const LogModel*>(index.model());
    return model->itemAt(index.row()).integer(contract::kFsckVerbosity) < detailVerbosity;
}

void drawBackground(QPainter& painter, const QStyleOptionViewItem& option)
{
    QStyleOptionViewItem background = option;
    background.text.clear();
    const QStyle* const style =
        option.widget != nullptr ? option.widget->style() : QApplication::style();
    style->drawControl(QStyle::CE_ItemViewItem, &background, &painter, option.widget);
}

}  // namespace

void LogDelegate::paint(QPainter* painter, const QStyleOptionViewItem& option,
                        const QModelIndex& index) const
{
    drawBackground(*painter, option);
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

}  // namespace orvane::desktop
