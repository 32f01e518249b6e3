// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/DiskRow.h"

#include "contract/foundation/UTF8.h"
#include "contract/pellar/MessageKeys.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/support/disks/DiskFacts.h"

#include <QLocale>
#include <QPainter>
#include <QPainterPath>
#include <QPalette>
#include <QPixmap>
#include <QStringList>

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
const QColor amberColor(0xb0, 0x74, 0x08);

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

std::string_view kindText(std::int32_t type)
{
    switch (type) {
        case diskType::container: return "container";
        case diskType::volume:
        case diskType::bareVolume: return "volume";
        case diskType::diskImage: return "disk image";
        case diskType::assembled: return "assembled volume";
        case diskType::opticalDisc: return "optical disc";
        default: return "disk";
    }
}

QString timeText(const QDateTime& time)
{
    return QLocale().toString(time, QLocale::ShortFormat);
}

/// "11/22/26 2:08 AM, then stopped"
QString lastCheckText(const LastCheck& check, const Translator& texts)
{
    const QString time = timeText(check.told.started);
    return check.later
               ? toQt(texts.sentence("%@, then %@",
                                     {fromQt(time), fromQt(verdictText(*check.later, texts))}))
               : time;
}

QStringList toolTipOfCheck(const LastCheck& check, const Translator& texts)
{
    QStringList lines;
    if (check.isPartial)
        lines += toQt(texts.text("not all of its volumes have been checked"));
    if (!check.part.empty())
        lines += toQt(texts.sentence("on it: “%@”", {contract::printable(check.part)}));
    lines += toQt(texts.sentence("last checked %@: %@", {fromQt(timeText(check.told.started)),
                                                         fromQt(verdictText(check.told, texts))}));
    if (!check.told.message.empty())
        lines += toQtLine(check.told.message);
    if (!check.later)
        return lines;
    lines += toQt(texts.sentence("after that, %@: %@", {fromQt(timeText(check.later->started)),
                                                        fromQt(verdictText(*check.later, texts))}));
    if (!check.later->message.empty())
        lines += toQtLine(check.later->message);
    return lines;
}

}  // namespace

DiskNames namesOf(const DiskRow& row)
{
    const DiskFacts& facts = row.facts;
    const QString file = toQtLine(facts.path.filename().native());
    const QString label = toQtLine(row.label);
    const bool isInImage = facts.storage == contract::DiskReference::Storage::FileRegion &&
                           facts.type != diskType::diskImage;
    if (!label.isEmpty() && !isInImage && !file.isEmpty())
        return {label, file};
    const QString name = toQtLine(facts.name);
    return {name.isEmpty() ? file : name, {}};
}

QString nameText(const DiskRow& row)
{
    const DiskNames names = namesOf(row);
    return names.bearer.isEmpty()
               ? names.name
               : names.name + QStringLiteral(" (") + names.bearer + QLatin1Char(')');
}

QString formatText(const DiskRow& row, const Translator& texts)
{
    return row.format.empty() ? toQt(texts.text(kindText(row.facts.type))) : toQtLine(row.format);
}

QString sizeText(std::uint64_t bytes)
{
    if (bytes == 0)
        return {};
    return QLocale().formattedDataSize(static_cast<qint64>(bytes), 1, QLocale::DataSizeIecFormat);
}

QString verdictText(const Check& check, const Translator& texts)
{
    return toQt(texts.text(check.verdict.empty() ? std::string_view("cut off") : check.verdict));
}

bool isGood(std::string_view verdict)
{
    return verdict == contract::kPLVerdictSound.text() ||
           verdict == contract::kPLVerdictRepaired.text();
}

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
    if (isGood(verdict))
        return check;
    return verdict == contract::kPLVerdictDamaged.text() ? cross : mark;
}

std::string percentText(double percent, const Translator& texts)
{
    return texts.sentence("%ld %%", {static_cast<long>(percent)});
}

QString stateText(const DiskRow& row, const Translator& texts)
{
    if (!row.activity.empty())
        return toQtLine(row.percent > 0 ? row.activity + " " + percentText(row.percent, texts)
                                        : row.activity);
    if (!row.lastCheck)
        return {};
    if (row.lastCheck->isPartial)
        return toQt(texts.text("partly checked"));
    const QString verdict = verdictText(row.lastCheck->told, texts);
    if (row.lastCheck->part.empty() || isGood(row.lastCheck->told.verdict))
        return verdict;
    return toQtLine(texts.sentence("%@: %@", {fromQt(verdict), row.lastCheck->part}));
}

QString cellText(const DiskRow& row, DiskColumn column, const Translator& texts)
{
    switch (column) {
        case DiskColumn::Name: return nameText(row);
        case DiskColumn::Size: return sizeText(row.facts.length);
        case DiskColumn::Format: return toQtLine(row.format);
        case DiskColumn::MountPoint: return toQtLine(row.facts.mountPoint);
        case DiskColumn::Verdict: return stateText(row, texts);
        case DiskColumn::LastCheck:
            return row.lastCheck ? lastCheckText(*row.lastCheck, texts) : QString();
    }
    return {};
}

QString columnTitle(DiskColumn column, const Translator& texts)
{
    const auto title = [&](std::string_view key) {
        return toQt(texts.text(key));
    };
    switch (column) {
        case DiskColumn::Name: return title("Disk");
        case DiskColumn::Size: return title("Size");
        case DiskColumn::Format: return title("Format");
        case DiskColumn::MountPoint: return title("Mounted at");
        case DiskColumn::Verdict: return title("State");
        case DiskColumn::LastCheck: return title("Last checked");
    }
    return {};
}

QString rowDetails(const DiskRow& row, const Translator& texts, bool isShort)
{
    // There is room for a few words.
    if (!row.note.empty())
        return toQtLine(row.note);
    QStringList parts{formatText(row, texts)};
    if (row.facts.length != 0)
        parts += sizeText(row.facts.length);
    if (!row.facts.mountPoint.empty())
        parts += isShort ? toQtLine(row.facts.mountPoint)
                         : toQt(texts.sentence("mounted at %@",
                                               {contract::printable(row.facts.mountPoint)}));
    if (row.facts.hasSMARTError) {
        // What matters most is not what is cut off.
        if (isShort)
            parts.prepend(toQt(texts.text("failing")));
        else
            parts += toQt(texts.text("its drive says that it is failing"));
    }
    return parts.join(QStringLiteral(", "));
}

QString rowSummary(const DiskRow& row, const Translator& texts)
{
    QStringList parts{nameText(row)};
    if (const QString state = stateText(row, texts); !state.isEmpty())
        parts += state;
    parts += rowDetails(row, texts);
    if (row.lastCheck)
        parts +=
            toQt(texts.sentence("last checked %@", {fromQt(lastCheckText(*row.lastCheck, texts))}));
    return parts.join(QStringLiteral(", "));
}

QString rowToolTip(const DiskRow& row, const Translator& texts)
{
    QStringList lines{nameText(row), toQtLine(row.facts.path.native()),
                      toQt(texts.text(kindText(row.facts.type)))};
    if (row.facts.length != 0)
        lines.back() += QStringLiteral(", ") + sizeText(row.facts.length);
    if (!row.format.empty())
        lines.back() += QStringLiteral(", ") + toQtLine(row.format);
    if (!row.facts.mountPoint.empty())
        lines += toQt(texts.sentence("mounted at %@", {contract::printable(row.facts.mountPoint)}));
    if (!row.note.empty())
        lines += toQtLine(row.note);
    if (!row.activity.empty())
        lines += toQtLine(row.activity);
    if (row.lastCheck)
        lines += toolTipOfCheck(*row.lastCheck, texts);
    else if (row.activity.empty())
        lines += toQt(texts.text("never checked"));
    return lines.join(QLatin1Char('\n'));
}

QString searchText(const DiskRow& row, const Translator& texts)
{
    return QStringList{
        nameText(row),
        toQtLine(row.facts.name),
        toQtLine(row.facts.path.native()),
        formatText(row, texts),
        toQtLine(row.facts.model),
        toQtLine(row.facts.mountPoint),
        stateText(row, texts),
        row.lastCheck || !row.activity.empty() ? QString() : toQt(texts.text("never checked")),
        toQtLine(row.note)}
        .join(QLatin1Char('\n'));
}

}  // namespace orvane::desktop
