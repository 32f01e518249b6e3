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
    if (event->type() == QEvent::FontChange)
        fit();
}

void ElidedLabel::fit()
{
    const QString shown = fontMetrics().elidedText(fullText_, Qt::ElideMiddle, width());
    setText(shown);
    setToolTip(shown == fullText_ ? QString() : toQtToolTip(fromQt(fullText_)));
}

}  // namespace orvane::desktop
