// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/DiskRow.h"

#include "fixwell/host/foundation/UTF8.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/support/disks/DiskTypes.h"

#include <QLocale>
#include <QStringList>

namespace orvane::desktop {
namespace {

QString shown(const std::string& text)
{
    return toQt(fixwell::printable(text));
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

QString nameText(const DiskFacts& facts)
{
    const QString name = shown(facts.displayName);
    return name.isEmpty() ? shown(facts.path.filename().native()) : name;
}

QString sizeText(std::uint64_t bytes)
{
    if (bytes == 0)
        return {};
    return QLocale().formattedDataSize(static_cast<qint64>(bytes), 1, QLocale::DataSizeIecFormat);
}

QString timeText(const LastCheck& check)
{
    return QLocale().toString(check.started, QLocale::ShortFormat);
}

}  // namespace

QString verdictText(const LastCheck& check, const Translator& texts)
{
    return toQt(texts.text(check.verdict.empty() ? std::string_view("cut off") : check.verdict));
}

QString cellText(const DiskRow& row, DiskColumn column, const Translator& texts)
{
    switch (column) {
        case DiskColumn::Name: return nameText(row.facts);
        case DiskColumn::Size: return sizeText(row.facts.length);
        case DiskColumn::Format: return shown(row.filesystem);
        case DiskColumn::MountPoint: return shown(row.facts.mountPoint);
        case DiskColumn::Verdict:
            return row.lastCheck ? verdictText(*row.lastCheck, texts) : QString();
        case DiskColumn::LastCheck: return row.lastCheck ? timeText(*row.lastCheck) : QString();
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
    QStringList parts{row.filesystem.empty() ? toQt(texts.text(kindText(row.facts.type)))
                                             : shown(row.filesystem)};
    if (row.facts.length != 0)
        parts += sizeText(row.facts.length);
    if (!row.facts.mountPoint.empty())
        parts += toQt(texts.sentence("mounted at %@", {fixwell::printable(row.facts.mountPoint)}));
    if (row.facts.hasSMARTError)
        parts += toQt(texts.text("its drive says that it is failing"));
    return parts.join(QStringLiteral(", "));
}

QString rowSummary(const DiskRow& row, const Translator& texts)
{
    QStringList parts{nameText(row.facts)};
    if (row.lastCheck)
        parts += verdictText(*row.lastCheck, texts);
    parts += rowDetails(row, texts);
    if (row.lastCheck)
        parts += toQt(texts.sentence("last checked %@", {fromQt(timeText(*row.lastCheck))}));
    return parts.join(QStringLiteral(", "));
}

QString rowToolTip(const DiskRow& row, const Translator& texts)
{
    QStringList lines{nameText(row.facts), shown(row.facts.path.native()),
                      toQt(texts.text(kindText(row.facts.type)))};
    if (row.facts.length != 0)
        lines.back() += QStringLiteral(", ") + sizeText(row.facts.length);
    if (!row.filesystem.empty())
        lines.back() += QStringLiteral(", ") + shown(row.filesystem);
    if (!row.facts.mountPoint.empty())
        lines += toQt(texts.sentence("mounted at %@", {fixwell::printable(row.facts.mountPoint)}));
    if (!row.lastCheck) {
        lines += toQt(texts.text("never checked"));
        return lines.join(QLatin1Char('\n'));
    }
    lines +=
        toQt(texts.sentence("last checked %@: %@", {fromQt(timeText(*row.lastCheck)),
                                                    fromQt(verdictText(*row.lastCheck, texts))}));
    if (!row.lastCheck->message.empty())
        lines += shown(row.lastCheck->message);
    return lines.join(QLatin1Char('\n'));
}

}  // namespace orvane::desktop
