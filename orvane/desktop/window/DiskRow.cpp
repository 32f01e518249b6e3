// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/DiskRow.h"

#include "contract/foundation/UTF8.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/support/disks/DiskFacts.h"

#include <QLocale>
#include <QStringList>

namespace orvane::desktop {
namespace {

QString shown(const std::string& text)
{
    return toQt(contract::printable(text));
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

/// As the log names it, by its label, and with the file or the device that bears it.
QString nameText(const DiskRow& row)
{
    const DiskFacts& facts = row.facts;
    const QString file = shown(facts.path.filename().native());
    const QString label = shown(row.label);
    const bool isInImage = facts.storage == contract::DiskReference::Storage::FileRegion &&
                           facts.type != diskType::diskImage;
    if (!label.isEmpty() && !isInImage && !file.isEmpty())
        return label + QStringLiteral(" (") + file + QLatin1Char(')');
    const QString name = shown(facts.name);
    return name.isEmpty() ? file : name;
}

QString sizeText(std::uint64_t bytes)
{
    if (bytes == 0)
        return {};
    return QLocale().formattedDataSize(static_cast<qint64>(bytes), 1, QLocale::DataSizeIecFormat);
}

QString timeText(const QDateTime& time)
{
    return QLocale().toString(time, QLocale::ShortFormat);
}

QString verdictText(const Check& check, const Translator& texts)
{
    return toQt(texts.text(check.verdict.empty() ? std::string_view("cut off") : check.verdict));
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
        lines += shown(check.told.message);
    if (!check.later)
        return lines;
    lines += toQt(texts.sentence("after that, %@: %@", {fromQt(timeText(check.later->started)),
                                                        fromQt(verdictText(*check.later, texts))}));
    if (!check.later->message.empty())
        lines += shown(check.later->message);
    return lines;
}

}  // namespace

QString stateText(const DiskRow& row, const Translator& texts)
{
    if (!row.activity.empty())
        return shown(row.activity);
    if (!row.lastCheck)
        return {};
    return row.lastCheck->isPartial ? toQt(texts.text("partly checked"))
                                    : verdictText(row.lastCheck->told, texts);
}

QString cellText(const DiskRow& row, DiskColumn column, const Translator& texts)
{
    switch (column) {
        case DiskColumn::Name: return nameText(row);
        case DiskColumn::Size: return sizeText(row.facts.length);
        case DiskColumn::Format: return shown(row.filesystem);
        case DiskColumn::MountPoint: return shown(row.facts.mountPoint);
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

QString rowDetails(const DiskRow& row, const Translator& texts)
{
    // There is room for a few words.
    if (!row.note.empty())
        return shown(row.note);
    QStringList parts{row.filesystem.empty() ? toQt(texts.text(kindText(row.facts.type)))
                                             : shown(row.filesystem)};
    if (row.facts.length != 0)
        parts += sizeText(row.facts.length);
    if (!row.facts.mountPoint.empty())
        parts += toQt(texts.sentence("mounted at %@", {contract::printable(row.facts.mountPoint)}));
    if (row.facts.hasSMARTError)
        parts += toQt(texts.text("its drive says that it is failing"));
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
    QStringList lines{nameText(row), shown(row.facts.path.native()),
                      toQt(texts.text(kindText(row.facts.type)))};
    if (row.facts.length != 0)
        lines.back() += QStringLiteral(", ") + sizeText(row.facts.length);
    if (!row.filesystem.empty())
        lines.back() += QStringLiteral(", ") + shown(row.filesystem);
    if (!row.facts.mountPoint.empty())
        lines += toQt(texts.sentence("mounted at %@", {contract::printable(row.facts.mountPoint)}));
    if (!row.note.empty())
        lines += shown(row.note);
    if (!row.activity.empty())
        lines += shown(row.activity);
    if (row.lastCheck)
        lines += toolTipOfCheck(*row.lastCheck, texts);
    else if (row.activity.empty())
        lines += toQt(texts.text("never checked"));
    return lines.join(QLatin1Char('\n'));
}

}  // namespace orvane::desktop
