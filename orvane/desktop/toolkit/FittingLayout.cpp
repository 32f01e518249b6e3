// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/FittingLayout.h"

#include <QEvent>

#include <algorithm>
#include <utility>

namespace orvane::desktop {

bool Fitting::eventFilter(QObject* /*watched*/, QEvent* event)
{
    if (event->type() == QEvent::Resize || event->type() == QEvent::LayoutRequest)
        fit();
    return false;
}

// The height that is needed depends on the width, and on the text and its font.
FittingPane::FittingPane(QSplitter& splitter, QScrollArea& text)
    : Fitting(&splitter),
      splitter_(splitter),
      text_(text),
      least_(splitter.widget(0)->minimumHeight())
{
    watch(text);
    watch(*text.widget());
    connect(&splitter, &QSplitter::splitterMoved, this, [this] {
        if (!std::exchange(wasMoved_, true))
            splitter_.widget(0)->setMinimumHeight(least_);
    });
}

void FittingPane::fit()
{
    const QList<int> sizes = splitter_.sizes();
    // Giving the pane another height is a reason to ask again.
    if (wasMoved_ || isFitting_ || sizes.size() < 2 || !splitter_.isVisible())
        return;
    QWidget& pane = *splitter_.widget(0);
    // Before they are laid out, the text is higher than the pane that it lies in.
    const int beside = std::max(0, pane.height() - text_.viewport()->height());
    const int wanted = text_.widget()->heightForWidth(text_.viewport()->width()) + beside;
    const int height = std::min(wanted, pane.maximumHeight());
    isFitting_ = true;
    pane.setMinimumHeight(std::min(least_, height));
    if (height != sizes[0])
        splitter_.setSizes({height, sizes[0] + sizes[1] - height});
    isFitting_ = false;
}

// A button's title is another while a job runs.
FittingButtons::FittingButtons(QWidget& page, QGridLayout& grid, std::vector<QWidget*> actions,
                               QWidget* beside)
    : Fitting(&page), page_(page), grid_(grid), actions_(std::move(actions)), beside_(beside)
{
    watch(page);
    for (QWidget* const button : actions_)
        watch(*button);
}

void FittingButtons::fit()
{
    int widest = 0;
    for (const QWidget* const button : actions_)
        widest = std::max(widest, button->sizeHint().width());
    const auto count = static_cast<int>(actions_.size());
    const int needed = count * (widest + grid_.horizontalSpacing()) +
                       (beside_ != nullptr ? beside_->sizeHint().width() : 0);
    const QMargins margins = page_.layout()->contentsMargins();
    const int rows = needed <= page_.width() - margins.left() - margins.right() ? 1 : 2;
    // One row must not keep the window from being made too narrow for it.
    const int least = rows == 1 ? widest / 2 : 0;
    if (std::exchange(least_, least) != least)
        for (QWidget* const button : actions_)
            button->setMinimumWidth(least);
    if (std::exchange(rows_, rows) != rows)
        place(rows);
}

void FittingButtons::place(int rows)
{
    const auto count = static_cast<int>(actions_.size());
    const int columns = (count + rows - 1) / rows;
    for (int i = 0; i < count; ++i)
        grid_.addWidget(actions_[static_cast<std::size_t>(i)], i % rows, i / rows);
    if (beside_ != nullptr)
        grid_.addWidget(beside_, 0, columns);
    for (int column = 0; column <= count; ++column)
        grid_.setColumnStretch(column, column < columns ? 1 : 0);
}

}  // namespace orvane::desktop
