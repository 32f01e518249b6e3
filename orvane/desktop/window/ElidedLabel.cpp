// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/ElidedLabel.h"

#include "orvane/desktop/toolkit/Text.h"

#include <QEvent>

namespace orvane::desktop {

ElidedLabel::ElidedLabel(QWidget* parent) : QLabel(parent)
{
    setTextFormat(Qt::PlainText);
    setTextInteractionFlags(Qt::TextSelectableByMouse);
    setSizePolicy(QSizePolicy::Expanding, QSizePolicy::Fixed);
}

void ElidedLabel::setFullText(const QString& text)
{
    fullText_ = text;
    setAccessibleName(text);
    updateGeometry();
    fit();
}

QSize ElidedLabel::minimumSizeHint() const
{
    return {1, QLabel::sizeHint().height()};
}

QSize ElidedLabel::sizeHint() const
{
    return {fontMetrics().horizontalAdvance(fullText_) + 2, QLabel::sizeHint().height()};
}

void ElidedLabel::resizeEvent(QResizeEvent* event)
{
    QLabel::resizeEvent(event);
    fit();
}

void ElidedLabel::changeEvent(QEvent* event)
{
    QLabel::changeEvent(event);
    if (event->type() == QEvent::FontChange || event->type() == QEvent::LayoutDirectionChange)
        fit();
}

void ElidedLabel::fit()
{
    const QString shown = fontMetrics().elidedText(fullText_, Qt::ElideMiddle, width());
    setText(shown);
    // Selectable text would stand on the side of its own direction, away from its sign.
    const bool isMirrored = layoutDirection() == Qt::RightToLeft;
    setAlignment((isMirrored ? Qt::AlignRight : Qt::AlignLeft) | Qt::AlignAbsolute |
                 Qt::AlignVCenter);
    setToolTip(shown == fullText_ ? QString() : toQtToolTip(fromQt(fullText_)));
}

}  // namespace orvane::desktop
