// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/RunNotes.h"

#include "contract/foundation/Format.h"
#include "contract/foundation/UTF8.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/desktop/window/DiskRow.h"
#include "orvane/support/texts/Quantities.h"

#include <QDateTime>
#include <QLocale>

#include <string>

namespace orvane::desktop {
namespace {

QString dateText(RecordTimes::Time time)
{
    const auto milliseconds =
        std::chrono::duration_cast<std::chrono::milliseconds>(time.time_since_epoch());
    return QLocale().toString(QDateTime::fromMSecsSinceEpoch(milliseconds.count()),
                              QLocale::ShortFormat);
}

QString problemsText(std::int64_t problems, const Translator& texts)
{
    const std::string number = fromQt(QLocale().toString(qlonglong{problems}));
    return toQt(contract::format(
        texts.plural("%@ problem", "%@ problems", static_cast<long>(problems)), {number}));
}

}  // namespace

RunNote noteOf(const RunOfRecord& known, const Translator& texts)
{
    RunNote note;
    QStringList details{dateText(known.run ? known.run->started : known.time)};
    if (known.run) {
        const Run& run = *known.run;
        // A clock that was set back in the middle of a run measures nothing.
        if (run.finished && *run.finished >= run.started)
            details += toQt(durationText(*run.finished - run.started, texts));
        if (run.end && !run.end->tool.empty())
            details += toQt(contract::printable(run.end->tool));
        if (run.end && run.end->problems > 0)
            details += problemsText(run.end->problems, texts);
        if (const std::string verdict = run.verdict(); !verdict.empty())
            note.verdict = toQt(texts.text(verdict));
        if (run.end)
            note.sign = verdictIcon(run.end->verdict);
    }
    note.details = details.join(QStringLiteral(" · "));
    return note;
}

RunKnowledge runKnowledge(DiskHistories& histories, const Translator& texts)
{
    return {[&histories, &texts](const contract::OutlineItem& start) {
                const auto known = histories.runOf(start);
                return known ? noteOf(*known, texts) : RunNote();
            },
            [&histories](const contract::OutlineItem& start) {
                return histories.isNewestStart(start);
            }};
}

}  // namespace orvane::desktop
