// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/DiskIcons.h"

#include "contract/pellar/MessageKeys.h"

#include <QPainter>
#include <QPainterPath>
#include <QPalette>
#include <QPixmap>

#include <functional>

namespace orvane::desktop {
namespace {

using Drawing = std::function<void(QPainter& painter)>;

constexpr double side = 16;  ///< of the square that the drawings are made for

const QColor sheetColor(0xf4, 0xf4, 0xf0);
const QColor outlineColor(0x5a, 0x62, 0x6c);
const QColor metalColor(0xb9, 0xc2, 0xcc);
const QColor blueColor(0x3d, 0x7e, 0xb8);
const QColor greenColor(0x2e, 0x8b, 0x45);
const QColor redColor(0xc6, 0x2f, 0x2f);
const QColor amberColor(0xc9, 0x8a, 0x10);

// In several sizes, so that it is sharp in a menu, in the list, and on denser screens.
QIcon drawn(const Drawing& draw)
{
    QIcon icon;
    for (const int pixels : {16, 24, 32, 48, 64}) {
        QPixmap pixmap(pixels, pixels);
        pixmap.fill(Qt::transparent);
        QPainter painter(&pixmap);
        painter.setRenderHint(QPainter::Antialiasing);
        painter.scale(pixels / side, pixels / side);
        painter.setPen(outlineColor);
        draw(painter);
        painter.end();
        icon.addPixmap(pixmap);
    }
    return icon;
}

void drawDrive(QPainter& painter)
{
    painter.setBrush(metalColor);
    painter.drawRoundedRect(QRectF(1.5, 3.5, 13, 9), 1.5, 1.5);
    painter.drawLine(QPointF(1.5, 9.5), QPointF(14.5, 9.5));
    painter.setPen(Qt::NoPen);
    painter.setBrush(greenColor);
    painter.drawEllipse(QPointF(12, 11), 0.9, 0.9);
}

void drawVolume(QPainter& painter)
{
    painter.setBrush(blueColor);
    QPainterPath body(QPointF(2.5, 4.5));
    body.lineTo(2.5, 11.5);
    body.arcTo(QRectF(2.5, 9.5, 11, 4), 180, 180);
    body.lineTo(13.5, 4.5);
    painter.drawPath(body);
    painter.setBrush(metalColor);
    painter.drawEllipse(QRectF(2.5, 2.5, 11, 4));
}

void drawImage(QPainter& painter)
{
    painter.setBrush(sheetColor);
    painter.drawPolygon(
        QPolygonF({{3.5, 1.5}, {9.5, 1.5}, {12.5, 4.5}, {12.5, 14.5}, {3.5, 14.5}}));
    painter.setBrush(metalColor);
    painter.drawRoundedRect(QRectF(5.5, 8.5, 5, 3.5), 0.8, 0.8);
}

void drawDisc(QPainter& painter)
{
    painter.setBrush(metalColor);
    painter.drawEllipse(QPointF(8, 8), 6.5, 6.5);
    painter.setBrush(sheetColor);
    painter.drawEllipse(QPointF(8, 8), 2, 2);
}

/// A filled circle with a white sign in it: the signs differ in shape as well as in colour.
Drawing sign(const QColor& color, const QPolygonF& strokes)
{
    return [color, strokes](QPainter& painter) {
        painter.setPen(Qt::NoPen);
        painter.setBrush(color);
        painter.drawEllipse(QPointF(8, 8), 6.5, 6.5);
        painter.setPen(QPen(Qt::white, 1.8, Qt::SolidLine, Qt::RoundCap, Qt::RoundJoin));
        painter.setBrush(Qt::NoBrush);
        for (qsizetype i = 0; i + 1 < strokes.size(); i += 2)
            painter.drawLine(strokes[i], strokes[i + 1]);
    };
}

}  // namespace

QIcon diskIcon(const DiskFacts& facts)
{
    static const QIcon disc = drawn(drawDisc);
    static const QIcon image = drawn(drawImage);
    static const QIcon volume = drawn(drawVolume);
    static const QIcon drive = drawn(drawDrive);
    switch (facts.type) {
        case diskType::opticalDisc: return disc;
        case diskType::diskImage: return image;
        case diskType::volume:
        case diskType::bareVolume:
        case diskType::subvolume:
        case diskType::assembled: return volume;
        default: return drive;
    }
}

QIcon verdictIcon(std::string_view verdict)
{
    static const QIcon check =
        drawn(sign(greenColor, {{4.8, 8.4}, {7.1, 10.7}, {7.1, 10.7}, {11.2, 5.8}}));
    static const QIcon cross =
        drawn(sign(redColor, {{5.6, 5.6}, {10.4, 10.4}, {10.4, 5.6}, {5.6, 10.4}}));
    static const QIcon mark = drawn(sign(amberColor, {{8, 4.6}, {8, 8.8}, {8, 11.4}, {8, 11.5}}));
    if (verdict == contract::kPLVerdictSound.text() || verdict == contract::kPLVerdictRepaired.text())
        return check;
    return verdict == contract::kPLVerdictDamaged.text() ? cross : mark;
}

}  // namespace orvane::desktop
