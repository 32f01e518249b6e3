// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/Symbols.h"

#include <QGuiApplication>
#include <QIconEngine>
#include <QPainter>
#include <QPainterPath>

#include <algorithm>

namespace orvane::desktop {
namespace {

constexpr double side = 16;  ///< of the square that the strokes are made for
constexpr double strokeWidth = 1.25;

QPainterPath lines(const QList<QPolygonF>& strokes)
{
    QPainterPath path;
    for (const QPolygonF& stroke : strokes)
        path.addPolygon(stroke);
    return path;
}

QPainterPath magnifier()
{
    QPainterPath path;
    path.addEllipse(QPointF(6.75, 6.75), 4.75, 4.75);
    path.moveTo(10.3, 10.3);
    path.lineTo(14, 14);
    return path;
}

QPainterPath shieldWithCheck()
{
    QPainterPath path(QPointF(8, 1.5));
    path.lineTo(13.5, 3.5);
    path.lineTo(13.5, 7.5);
    path.cubicTo(13.5, 11, 11, 13.4, 8, 14.5);
    path.cubicTo(5, 13.4, 2.5, 11, 2.5, 7.5);
    path.lineTo(2.5, 3.5);
    path.closeSubpath();
    path.addPolygon(QPolygonF({{5.4, 8}, {7.2, 9.8}, {10.6, 6.2}}));
    return path;
}

QPainterPath wrench()
{
    QPainterPath path(QPointF(13.9, 4.6));
    path.lineTo(11.5, 6.9);
    path.lineTo(9.1, 4.5);
    path.lineTo(11.4, 2.1);
    path.cubicTo(8.8, 1.2, 6.2, 3.4, 7, 6.3);
    path.lineTo(2.3, 11);
    path.cubicTo(1.2, 12.4, 3.6, 14.8, 5, 13.7);
    path.lineTo(9.7, 9);
    path.cubicTo(12.6, 9.8, 14.8, 7.2, 13.9, 4.6);
    return path;
}

QPainterPath eye()
{
    QPainterPath path(QPointF(1.3, 8));
    path.cubicTo(4.2, 2.6, 11.8, 2.6, 14.7, 8);
    path.cubicTo(11.8, 13.4, 4.2, 13.4, 1.3, 8);
    path.addEllipse(QPointF(8, 8), 2, 2);
    return path;
}

/// An arrow that turns back to the left; `isMirrored`: to the right.
QPainterPath turn(bool isMirrored)
{
    QPainterPath path(QPointF(2.2, 6.2));
    path.lineTo(9.6, 6.2);
    path.cubicTo(14.9, 6.2, 14.9, 13.2, 9.6, 13.2);
    path.lineTo(5.5, 13.2);
    path.addPolygon(QPolygonF({{5.4, 2.8}, {2, 6.2}, {5.4, 9.6}}));
    return isMirrored ? QTransform(-1, 0, 0, 1, side, 0).map(path) : path;
}

QPainterPath folder()
{
    return lines(
        {{{1.6, 12.6}, {1.6, 3.2}, {6, 3.2}, {7.6, 5.2}, {14.4, 5.2}, {14.4, 12.6}, {1.6, 12.6}}});
}

QPainterPath sheetWithLines()
{
    return lines({{{3, 1.6}, {9.6, 1.6}, {13, 5}, {13, 14.4}, {3, 14.4}, {3, 1.6}},
                  {{5.6, 7.4}, {10.4, 7.4}},
                  {{5.6, 10.4}, {10.4, 10.4}}});
}

QPainterPath twoSheets()
{
    return lines({{{5.2, 5}, {14.2, 5}, {14.2, 14.2}, {5.2, 14.2}, {5.2, 5}},
                  {{2, 10.8}, {2, 1.8}, {11, 1.8}}});
}

QPainterPath sliders()
{
    QPainterPath path = lines({{{1.8, 4.6}, {7.6, 4.6}},
                               {{12, 4.6}, {14.2, 4.6}},
                               {{1.8, 11.4}, {4, 11.4}},
                               {{8.4, 11.4}, {14.2, 11.4}}});
    path.addEllipse(QPointF(9.8, 4.6), 2, 2);
    path.addEllipse(QPointF(6.2, 11.4), 2, 2);
    return path;
}

QPainterPath shapeOf(Symbol symbol)
{
    switch (symbol) {
        case Symbol::Verify: return shieldWithCheck();
        case Symbol::Repair: return wrench();
        case Symbol::Preview: return eye();
        case Symbol::Undo: return turn(false);
        case Symbol::Finish: return turn(true);
        case Symbol::Stop:
            return lines({{{3.2, 3.2}, {12.8, 3.2}, {12.8, 12.8}, {3.2, 12.8}, {3.2, 3.2}}});
        case Symbol::Open: return folder();
        case Symbol::Close: return lines({{{3.6, 3.6}, {12.4, 12.4}}, {{12.4, 3.6}, {3.6, 12.4}}});
        case Symbol::Search: return magnifier();
        case Symbol::Report: return sheetWithLines();
        case Symbol::Copy: return twoSheets();
        case Symbol::Settings: return sliders();
    }
    return {};
}

class SymbolEngine final : public QIconEngine {
public:
    SymbolEngine(Symbol symbol, QPalette::ColorRole role) : symbol_(symbol), role_(role) {}

    void paint(QPainter* painter, const QRect& rect, QIcon::Mode mode, QIcon::State) override
    {
        const auto group = mode == QIcon::Disabled ? QPalette::Disabled : QPalette::Active;
        const auto role = mode == QIcon::Selected ? QPalette::HighlightedText : role_;
        const double scale = std::min(rect.width(), rect.height()) / side;
        painter->save();
        painter->setRenderHint(QPainter::Antialiasing);
        painter->translate(rect.center().x() + 0.5 - scale * side / 2,
                           rect.center().y() + 0.5 - scale * side / 2);
        painter->scale(scale, scale);
        painter->setPen(QPen(QGuiApplication::palette().color(group, role), strokeWidth,
                             Qt::SolidLine, Qt::RoundCap, Qt::RoundJoin));
        painter->setBrush(Qt::NoBrush);
        painter->drawPath(shapeOf(symbol_));
        painter->restore();
    }

    QPixmap pixmap(const QSize& size, QIcon::Mode mode, QIcon::State state) override
    {
        QPixmap pixmap(size);
        pixmap.fill(Qt::transparent);
        QPainter painter(&pixmap);
        paint(&painter, QRect(QPoint(), size), mode, state);
        return pixmap;
    }

    QIconEngine* clone() const override { return new SymbolEngine(*this); }

private:
    Symbol symbol_;
    QPalette::ColorRole role_;
};

}  // namespace

QIcon symbol(Symbol symbol, QPalette::ColorRole role)
{
    return QIcon(new SymbolEngine(symbol, role));
}

}  // namespace orvane::desktop
