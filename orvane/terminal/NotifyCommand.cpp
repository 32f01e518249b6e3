// SPDX-License-Identifier: Apache-2.0
#include "contract/pellar/MessageKeys.h"
#include "orvane/support/files/WholeFile.h"
#include "orvane/support/texts/Quantities.h"
#include "orvane/terminal/Commands.h"
#include "orvane/terminal/DesktopNotice.h"

#include <algorithm>
#include <charconv>

namespace orvane {
namespace {

using Time = Run::Time;
using Milliseconds = std::chrono::milliseconds;

/// In the user's own directory: when the last check began of which the desktop was told.
class ToldChecks {
public:
    ToldChecks() : file_(fileIn(userXDGPaths().state, "told-checks")) {}

    Time newest() const
    {
        const auto text = readWholeFile(file_, 64);
        std::int64_t number = 0;
        if (text)
            std::from_chars(text->data(), text->data() + text->size(), number);
        return Time(Milliseconds(number));
    }

    Result<void, Failure> keep(Time time) const
    {
        if (file_.empty())
            return {};
        if (const auto made = createPrivateDirectory(file_.parent_path()); !made)
            return made.error();
        const auto number = std::chrono::duration_cast<Milliseconds>(time.time_since_epoch());
        return replaceFile(file_, std::to_string(number.count()) + "\n");
    }

private:
    const std::filesystem::path file_;
};

/// What the user is to hear of at once: damage, and a check that came to no answer.
bool isNews(const PublishedCheck& check, Time told)
{
    return check.run && check.run->end && check.run->started > told &&
           check.run->end->verdict != contract::kPLVerdictSound.text() &&
           check.run->end->verdict != contract::kPLVerdictStopped.text();
}

std::string lineOn(const PublishedCheck& check, const Translator& texts)
{
    return texts.sentence("%@: %@ (%@)",
                          {contract::printable(check.device), texts.text(check.run->end->verdict),
                           localTime(check.run->started)});
}

}  // namespace

// Told first, kept after: what the desktop did not take is told again.
int runNotify(Session& session, Reporter& reporter)
{
    const ToldChecks told;
    const Translator& texts = session.texts();
    Time newest = told.newest();
    DesktopNotice notice{texts.text("A scheduled check found something wrong"), {}};
    for (const auto& [key, check] : session.publishedChecks())
        if (isNews(check, told.newest())) {
            newest = std::max(newest, check.run->started);
            notice.lines.push_back(lineOn(check, texts));
        }
    if (notice.lines.empty())
        return exitSound;
    if (const auto shown = showOnDesktop(notice); !shown) {
        reporter.warning(shown.error().message);
        return exitUnchecked;
    }
    if (const auto kept = told.keep(newest); !kept)
        reporter.warning(kept.error().message);
    return exitSound;
}

}  // namespace orvane
