// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/SelectionSummary.h"

#include "contract/foundation/UTF8.h"
#include "contract/pellar/MessageKeys.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QHash>
#include <QLocale>

#include <algorithm>
#include <array>
#include <numeric>

namespace orvane::desktop {
namespace {

const QString separator = QStringLiteral(" · ");

QString stateOf(const DiskRow& row, const QDateTime& now, const Translator& texts)
{
    const QString state = stateText(row, texts);
    if (!row.activity.empty())
        return capitalized(state);
    const QString next = row.nextCheck ? nextCheckText(*row.nextCheck, now, texts) : QString();
    const auto withNext = [&next](const QString& text) {
        return next.isEmpty() ? text : text + separator + next;
    };
    if (!row.lastCheck)
        return withNext(toQt(texts.text("Never checked")));
    const LastCheck& check = *row.lastCheck;
    QString text = capitalized(state) + separator + ageText(check.told.started, now, texts);
    if (check.later)
        text +=
            separator + toQt(texts.sentence("then %@", {fromQt(verdictText(*check.later, texts))}));
    return withNext(text);
}

SelectionSummary summaryOfOne(const DiskRow& row, const QDateTime& now, const Translator& texts)
{
    const DiskNames names = namesOf(row);
    QStringList facts{formatText(row, texts)};
    if (row.facts.length != 0)
        facts += sizeText(row.facts.length);
    if (!row.facts.model.empty() && toQtLine(row.facts.model) != names.name)
        facts += toQtLine(row.facts.model);
    if (!row.facts.mountPoint.empty())
        facts += toQt(texts.sentence("mounted at %@", {contract::printable(row.facts.mountPoint)}));
    if (!row.note.empty())
        facts += toQtLine(row.note);
    facts += toQtLine(row.facts.path.native());

    SelectionSummary summary;
    summary.title = names.name;
    summary.facts = facts.join(separator);
    summary.state = stateOf(row, now, texts);
    if (row.activity.empty() && row.lastCheck && !row.lastCheck->isPartial)
        summary.verdict = row.lastCheck->told.verdict;
    if (row.facts.hasSMARTError)
        summary.warning = toQt(texts.text("Its drive says that it is failing. Copy what matters."));
    return summary;
}

void addSpace(SelectionSummary& summary, const DiskRow& row, const Translator& texts)
{
    // What a damaged volume says of itself may be part of the damage.
    const std::string_view verdict =
        row.lastCheck ? std::string_view(row.lastCheck->told.verdict) : "";
    const bool isDoubtful = row.lastCheck && verdict != contract::kPLVerdictSound.text() &&
                            verdict != contract::kPLVerdictRepaired.text();
    if (!row.facts.space || (isDoubtful && row.facts.mountPoint.empty()))
        return;
    summary.space = row.facts.space;
    summary.spaceText =
        toQt(texts.sentence("%@ of %@ used", {fromQt(sizeText(summary.space->used)),
                                              fromQt(sizeText(summary.space->total))}));
}

void addPartitions(SelectionSummary& summary, const std::vector<DiskRow>& parts,
                   const Translator& texts)
{
    for (const DiskRow& part : parts)
        summary.partitions.push_back({namesOf(part).name, rowToolTip(part, texts),
                                      part.facts.length, part.facts.identifier,
                                      part.lastCheck ? part.lastCheck->told.verdict : ""});
}

SelectionSummary summaryOfSeveral(const std::vector<DiskRow>& rows, const Translator& texts)
{
    SelectionSummary summary;
    const auto count = static_cast<long>(rows.size());
    summary.title = toQt(contract::format(texts.plural("%ld disk", "%ld disks", count), {count}));
    const std::uint64_t bytes = std::accumulate(
        rows.begin(), rows.end(), std::uint64_t{0},
        [](std::uint64_t sum, const DiskRow& row) { return sum + row.facts.length; });
    QStringList facts;
    if (bytes != 0)
        facts += toQt(texts.sentence("%@ in all", {fromQt(sizeText(bytes))}));
    facts += distinctNames(rows).join(QStringLiteral(", "));
    summary.facts = facts.join(separator);
    summary.state = countsOf(rows, texts);
    if (std::ranges::any_of(rows, [](const DiskRow& row) { return row.facts.hasSMARTError; }))
        summary.warning = toQt(texts.text("A drive says that it is failing. Copy what matters."));
    return summary;
}

}  // namespace

QStringList distinctNames(const std::vector<DiskRow>& rows)
{
    QHash<QString, int> counts;
    for (const DiskRow& row : rows)
        ++counts[namesOf(row).name];
    QStringList names;
    for (const DiskRow& row : rows)
        names += counts[namesOf(row).name] > 1 ? nameText(row) : namesOf(row).name;
    return names;
}

QString countsOf(const std::vector<DiskRow>& rows, const Translator& texts)
{
    struct State {
        std::string_view verdict;
        std::string_view count;
    };
    static constexpr std::string_view partly = "partly checked";
    static constexpr std::string_view never = "never checked";
    static const std::array states{
        State{contract::kPLVerdictDamaged.text(), "%ld damaged"},
        State{contract::kPLVerdictFailed.text(), "%ld failed"},
        State{contract::kPLVerdictInconclusive.text(), "%ld inconclusive"},
        State{contract::kPLVerdictStopped.text(), "%ld stopped"},
        State{"", "%ld cut off"},
        State{contract::kPLVerdictUndone.text(), "%ld undone"},
        State{contract::kPLVerdictRepaired.text(), "%ld repaired"},
        State{contract::kPLVerdictSound.text(), "%ld sound"},
        State{partly, "%ld partly checked"},
        State{never, "%ld never checked"}};
    const auto stateOf = [](const DiskRow& row) -> std::string_view {
        return !row.lastCheck             ? never
               : row.lastCheck->isPartial ? partly
                                          : std::string_view(row.lastCheck->told.verdict);
    };
    QStringList parts;
    for (const State& state : states)
        if (const auto number = static_cast<long>(std::ranges::count_if(
                rows, [&](const DiskRow& row) { return stateOf(row) == state.verdict; }));
            number > 0)
            parts +=
                toQt(contract::format(texts.plural(state.count, state.count, number), {number}));
    return parts.join(QStringLiteral(", "));
}

QString capitalized(QString text)
{
    if (!text.isEmpty())
        text[0] = text[0].toUpper();
    return text;
}

QString ageText(const QDateTime& then, const QDateTime& now, const Translator& texts)
{
    struct Unit {
        qint64 seconds;
        std::string_view one;
        std::string_view many;
    };
    static constexpr std::array units{
        Unit{86400, "%ld day ago", "%ld days ago"},
        Unit{3600, "%ld hour ago", "%ld hours ago"},
        Unit{60, "%ld minute ago", "%ld minutes ago"},
    };
    constexpr qint64 mostDays = 30;
    const qint64 age = then.secsTo(now);
    if (age < -60 || age > mostDays * units.front().seconds)
        return QLocale().toString(then.date(), QLocale::ShortFormat);
    for (const Unit& unit : units)
        if (const auto count = static_cast<long>(age / unit.seconds); count > 0)
            return toQt(contract::format(texts.plural(unit.one, unit.many, count), {count}));
    return toQt(texts.text("just now"));
}

QString nextCheckText(const QDateTime& next, const QDateTime& now, const Translator& texts)
{
    const qint64 days = now.date().daysTo(next.date());
    if (next < now)
        return {};
    if (days < 2)
        return toQt(texts.text(days == 0 ? "next check today" : "next check tomorrow"));
    const QLocale locale;
    const QString day = days < 7 ? locale.standaloneDayName(next.date().dayOfWeek())
                                 : locale.toString(next.date(), QLocale::ShortFormat);
    return toQt(texts.sentence("next check on %@", {fromQt(day)}));
}

SelectionSummary summaryOf(const std::vector<DiskRow>& selected, const std::vector<DiskRow>& parts,
                           const QDateTime& now, const Translator& texts)
{
    if (selected.empty())
        return {toQt(texts.text("No disk is selected")),
                toQt(texts.text("Select disks in the list, or open an image.")),
                {},
                {},
                {},
                {},
                {},
                {}};
    if (selected.size() > 1)
        return summaryOfSeveral(selected, texts);
    SelectionSummary summary = summaryOfOne(selected.front(), now, texts);
    if (parts.empty())
        addSpace(summary, selected.front(), texts);
    else
        addPartitions(summary, parts, texts);
    return summary;
}

}  // namespace orvane::desktop
