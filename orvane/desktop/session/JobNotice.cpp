// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/session/JobNotice.h"

#include "contract/foundation/UTF8.h"
#include "contract/pellar/MessageKeys.h"

#include <algorithm>

namespace orvane::desktop {
namespace {

constexpr std::size_t mostLines = 4;  // a bubble is small

std::string titleOf(const std::vector<FinishedRun>& runs, const Translator& texts)
{
    const StartedRun& first = runs.front().run;
    const bool isRepair = first.isRepair();
    if (runs.size() == 1)
        return texts.sentence(
            isRepair ? texts.text("Repair of “%@”") : texts.text("Verification of “%@”"),
            {contract::printable(first.disk)});
    const long count = static_cast<long>(runs.size());
    return contract::format(
        isRepair ? texts.plural("Repair of %ld disk", "Repair of %ld disks", count)
                 : texts.plural("Verification of %ld disk", "Verification of %ld disks", count),
        {count});
}

std::string lineOf(const FinishedRun& finished, const Translator& texts)
{
    const std::string& message = finished.end.message;
    return noticeMarkup(
        message.empty() ? finished.run.disk + ": " + texts.text(finished.end.verdict) : message);
}

bool isSound(const FinishedRun& finished)
{
    return finished.end.verdict == contract::kPLVerdictSound.text();
}

}  // namespace

bool isWorthANotice(std::chrono::steady_clock::duration length, bool isWindowActive,
                    std::chrono::steady_clock::duration glance)
{
    return length > glance && !isWindowActive;
}

Notice noticeOf(std::vector<FinishedRun> runs, const Translator& texts)
{
    Notice notice{titleOf(runs, texts), ""};
    std::stable_partition(runs.begin(), runs.end(),
                          [](const FinishedRun& run) { return !isSound(run); });
    const std::size_t shown = runs.size() > mostLines ? mostLines - 1 : runs.size();
    for (std::size_t i = 0; i < shown; ++i)
        notice.body += (i == 0 ? "" : "\n") + lineOf(runs[i], texts);
    if (shown < runs.size())
        notice.body +=
            "\n" + texts.sentence("and %ld more", {static_cast<long>(runs.size() - shown)});
    return notice;
}

std::string noticeMarkup(std::string_view text)
{
    std::string markup;
    for (const char c : contract::printable(text))
        switch (c) {
            case '&': markup += "&amp;"; break;
            case '<': markup += "&lt;"; break;
            case '>': markup += "&gt;"; break;
            default: markup += c;
        }
    return markup;
}

}  // namespace orvane::desktop
