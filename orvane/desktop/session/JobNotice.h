// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/jobs/JobLedger.h"
#include "orvane/support/texts/Translator.h"

#include <chrono>
#include <string>
#include <string_view>
#include <vector>

namespace orvane::desktop {

struct FinishedRun {
    StartedRun run;
    RunEnd end;
};

/// What the desktop is asked to show.
struct Notice {
    std::string title;  ///< plain text
    std::string body;   ///< markup, with everything of ours escaped
};

/// Nobody is called back for what took no longer.
inline constexpr std::chrono::seconds longestGlanceAway{10};

/// Whether a job's end is news to the user: who looks at the window has seen it.
[[nodiscard]] bool isWorthANotice(std::chrono::steady_clock::duration length, bool isWindowActive,
                                  std::chrono::steady_clock::duration glance = longestGlanceAway);

/// What a job did, at least one run, and how it went; what was not found sound comes first.
[[nodiscard]] Notice noticeOf(std::vector<FinishedRun> runs, const Translator& texts);

/// `text` for a notification's body, which is markup (Desktop Notifications Specification,
/// "Markup"): one line in which nothing is a tag.
[[nodiscard]] std::string noticeMarkup(std::string_view text);

}  // namespace orvane::desktop
