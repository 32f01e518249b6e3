// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/DropNote.h"

#include <QPainter>

namespace orvane::desktop {
namespace {

constexpr int frame = 3;        // pixels
constexpr int margin = 12;      // pixels, around the words
constexpr double rounding = 6;  // pixels

}  // namespace

DropNote::DropNote(QWidget* parent) : QWidget(parent)
{
    setObjectName(QStringLiteral("dropNote"));
    // What is dropped falls on the window below.
    setAttribute(Qt::WA_TransparentForMouseEvents);
    hide();
}

void DropNote::tell(const QString& text)
{
    text_ = text;
    setAccessibleName(text);
    setGeometry(parentWidget()->rect());
    raise();
    show();
    update();
}

void DropNote::paintEvent(QPaintEvent* /*event*/)
{
    QPainter painter(this);
    painter.setRenderHint(QPainter::Antialiasing);
    QColor veil = palette().color(QPalette::Window);
    veil.setAlphaF(0.6F);
    painter.fillRect(rect(), veil);
    const QColor color = palette().color(QPalette::Highlight);
    constexpr double half = frame / 2.0;
    painter.setPen(QPen(color, frame));
    painter.setBrush(Qt::NoBrush);
    painter.drawRoundedRect(QRectF(rect()).adjusted(half, half, -half, -half), rounding, rounding);

    QFont large = font();
    large.setBold(true);
    painter.setFont(large);
    const QRect widest = rect().adjusted(2 * margin, 2 * margin, -2 * margin, -2 * margin);
    const QString shown =
        painter.fontMetrics().elidedText(text_, Qt::ElideMiddle, widest.width() - 2 * margin);
    QRect words = painter.fontMetrics().boundingRect(shown);
    words.moveCenter(rect().center());
    painter.setPen(Qt::NoPen);
    painter.setBrush(color);
    painter.drawRoundedRect(words.adjusted(-margin, -margin, margin, margin), rounding, rounding);
    painter.setPen(palette().color(QPalette::HighlightedText));
    painter.drawText(words.adjusted(-margin, 0, margin, 0), Qt::AlignCenter | Qt::TextSingleLine,
                     shown);
}

}  // namespace orvane::desktop
