// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/LogDelegate.h"

#include "orvane/desktop/toolkit/DesktopFont.h"
#include "orvane/desktop/toolkit/LogModel.h"
#include "orvane/desktop/toolkit/StyledLine.h"

#include <QApplication>
#include <QPainter>

namespace orvane::desktop {
namespace {

LineLooks looksOf(const QStyleOptionViewItem& option, const fixwell::Font& font)
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
    const auto* const model = static_cast<const LogModel*>(index.model());
    fixwell::OutlineView* const view = model->view();
    if (view == nullptr || view->dataCell() == nullptr)
        return;
    const auto row = static_cast<std::size_t>(index.row());
    const fixwell::Rect frame = view->frameOfCellAtColumnRow(0, row);
    draw(*painter, QRectF(frame.x, frame.y, frame.width, frame.height),
         oneLine(textOfRow(*view, row)), looksOf(option, view->dataCell()->font()));
}

}  // namespace orvane::desktop
