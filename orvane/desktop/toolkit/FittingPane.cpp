// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/FittingPane.h"

#include <QEvent>

namespace orvane::desktop {

FittingPane::FittingPane(QSplitter& splitter, QScrollArea& text)
    : QObject(&splitter), splitter_(splitter), text_(text)
{
    text.installEventFilter(this);
    text.widget()->installEventFilter(this);
    connect(&splitter, &QSplitter::splitterMoved, this, [this] { wasMoved_ = true; });
}

bool FittingPane::eventFilter(QObject* /*watched*/, QEvent* event)
{
    // The height that is needed depends on the width, and on the text and its font.
    if (event->type() == QEvent::Resize || event->type() == QEvent::LayoutRequest)
        fit();
    return false;
}

void FittingPane::fit()
{
    const QList<int> sizes = splitter_.sizes();
    // Giving the pane another height is a reason to ask again.
    if (wasMoved_ || isFitting_ || sizes.size() < 2 || !splitter_.isVisible())
        return;
    const int beside = splitter_.widget(0)->height() - text_.viewport()->height();
    const int wanted = text_.widget()->heightForWidth(text_.viewport()->width()) + beside;
    const QWidget& pane = *splitter_.widget(0);
    const int height = qBound(pane.minimumHeight(), wanted, pane.maximumHeight());
    isFitting_ = true;
    if (height != sizes[0])
        splitter_.setSizes({height, sizes[0] + sizes[1] - height});
    isFitting_ = false;
}

}  // namespace orvane::desktop
