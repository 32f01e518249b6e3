// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/DiskProperties.h"

#include "orvane/desktop/toolkit/Text.h"
#include "orvane/support/disks/FormatName.h"

#include <QLocale>
#include <QStringList>

namespace orvane::desktop {
namespace {

/// "8.0 MiB (8,388,608 bytes)"
QString exactSize(std::uint64_t bytes, const Translator& texts)
{
    return bytes == 0
               ? QString()
               : toQt(texts.sentence("%@ (%@ bytes)",
                                     {fromQt(sizeText(bytes)),
                                      fromQt(QLocale().toString(static_cast<qulonglong>(bytes)))}));
}

QString useText(const DiskRow& row, const Translator& texts)
{
    if (!row.facts.space)
        return {};
    return toQt(texts.sentence("%@ of %@ used", {fromQt(sizeText(row.facts.space->used)),
                                                 fromQt(sizeText(row.facts.space->total))}));
}

QString mapText(const DiskFacts& facts, const Translator& texts)
{
    const QString kind = toQtLine(partitionMapName(facts.partitionMap));
    if (!facts.hasDamagedMap)
        return kind;
    const QString damaged = toQt(texts.text("damaged"));
    return kind.isEmpty() ? damaged : kind + QStringLiteral(", ") + damaged;
}

// That a drive has said nothing is no proof of its health.
QString healthText(const DiskFacts& facts, const Translator& texts)
{
    if (facts.hasSMARTError)
        return toQt(texts.text("Its drive says that it is failing. Copy what matters."));
    return facts.model.empty() ? QString() : toQt(texts.text("The drive reports no failure."));
}

/// "11/22/26 2:08 AM, inner: damaged. MESSAGE"
QString runText(const NamedCheck& run, const Translator& texts)
{
    QString text = QLocale().toString(run.check.started, QLocale::ShortFormat);
    if (!run.part.empty())
        text += QStringLiteral(", ") + toQtLine(run.part);
    text += QStringLiteral(": ") + verdictText(run.check, texts);
    if (!run.check.message.empty())
        text += QStringLiteral(". ") + toQtLine(run.check.message);
    return text;
}

}  // namespace

std::vector<DiskProperty> propertiesOf(const DiskRow& row, const std::vector<NamedCheck>& runs,
                                       const Translator& texts)
{
    std::vector<DiskProperty> properties;
    const auto add = [&](std::string_view name, const QString& value) {
        if (!value.isEmpty())
            properties.push_back({toQt(texts.text(name)), value});
    };
    const DiskFacts& facts = row.facts;
    const bool isDevice = facts.storage == contract::DiskReference::Storage::BlockDevice;
    add("Name", toQtLine(facts.name));
    add("Label", toQtLine(row.label));
    add("UUID", toQtLine(facts.uuid));
    add("Format", formatText(row, texts));
    add("Size", exactSize(facts.length, texts));
    add("Used", useText(row, texts));
    add(isDevice ? "Device" : "File", toQtLine(facts.path.native()));
    add("Mounted at", toQtLine(facts.mountPoint));
    add("Model", toQtLine(facts.model));
    add("Health", healthText(facts, texts));
    add("Partition map", mapText(facts, texts));
    add("Note", toQtLine(row.note));
    add("State", stateText(row, texts));
    QStringList lines;
    for (const NamedCheck& run : runs)
        lines += runText(run, texts);
    add("Last runs", lines.isEmpty() ? toQt(texts.text("never checked")) : lines.join('\n'));
    return properties;
}

QString plainText(const std::vector<DiskProperty>& properties)
{
    QString text;
    for (const DiskProperty& property : properties)
        text += property.name + QStringLiteral(": ") +
                QString(property.value).replace('\n', QLatin1String("\n    ")) + QLatin1Char('\n');
    return text;
}

}  // namespace orvane::desktop
