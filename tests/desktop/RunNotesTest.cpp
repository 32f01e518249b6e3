// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/RunNotes.h"

#include <QLocale>

#include <gtest/gtest.h>

#include <chrono>
#include <string>

namespace orvane::desktop {
namespace {

using namespace std::chrono_literals;
using KeptRun = Run;  // a test has a Run of its own

// Behind the date, which is as the user writes dates.
TEST(RunNotes, SayWhatIsKnownAndNothingElse)
{
    const KeptRun::Time start{1000h};
    const RunEnd damaged{"damaged", 7, "why", "e2fsck 1.47.0", 7, 3};
    struct Case {
        std::optional<KeptRun> run;
        std::string details;
        std::string verdict;
        std::string_view because;
    };
    for (const Case& c :
         {Case{std::nullopt, "", "", "a run that did not begin, or is not kept"},
          Case{KeptRun{"verify", start, {}, {}, false}, "", "", "it was cut off"},
          Case{KeptRun{"verify", start, {}, {}, true}, "", "running", "it goes on"},
          Case{KeptRun{"verify", start, start + 400ms, damaged},
               " · less than a second · e2fsck 1.47.0 · 7 problems", "damaged", "all is known"},
          Case{KeptRun{"verify", start, start + 59s, RunEnd{"sound", 0, "", "", 1}},
               " · 59 s · 1 problem", "sound", "no tool"},
          Case{KeptRun{"verify", start, start + 61s, RunEnd{"sound", 0, "", "a\x1b[2J"}},
               " · 1 min 1 s · a\uFFFD[2J", "sound", "what a tool says may be hostile"},
          Case{KeptRun{"verify", start, start + 3h + 62s, RunEnd{"failed", 0, ""}}, " · 3 h 1 min",
               "failed", "nothing but the end"},
          Case{KeptRun{"verify", start, start - 1s, RunEnd{"sound", 0, ""}}, "", "sound",
               "the clock was set back"}}) {
        const RunNote note = noteOf({start, c.run}, Translator());
        const QString details = note.details.section(QStringLiteral(" · "), 1);
        EXPECT_EQ((details.isEmpty() ? "" : " · ") + details.toStdString(), c.details) << c.because;
        EXPECT_FALSE(note.details.isEmpty()) << c.because;
        EXPECT_EQ(note.verdict.toStdString(), c.verdict) << c.because;
        EXPECT_EQ(note.sign.isNull(), !c.run || !c.run->end) << c.because;
    }
}

}  // namespace
}  // namespace orvane::desktop
