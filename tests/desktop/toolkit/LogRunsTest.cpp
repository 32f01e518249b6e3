// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/LogRuns.h"

#include <gtest/gtest.h>

#include <string>
#include <string_view>

namespace orvane::desktop {
namespace {

/// In a log: H an open heading, h a folded one, k a row that a filter keeps, any other a row.
LogRuns::Row kindOf(char row)
{
    return row == 'H' || row == 'h' ? LogRuns::Row::Heading
           : row == 'k'             ? LogRuns::Row::Kept
                                    : LogRuns::Row::Other;
}

/// The first rows of the log are told from the end, the others behind it.
LogRuns runsOf(std::string_view log, std::size_t inFront, LogRuns::Filter filter,
               std::size_t unknown = 0)
{
    LogRuns runs;
    runs.begin(static_cast<int>(inFront), filter);
    for (std::size_t row = inFront; row-- > unknown;)
        runs.addInFront(kindOf(log[row]), log[row] == 'H');
    for (std::size_t row = inFront; row < log.size(); ++row)
        runs.addAtEnd(kindOf(log[row]), log[row] == 'H');
    return runs;
}

/// The rows that are shown, by their numbers; both ways of asking agree.
std::string shown(const LogRuns& runs)
{
    std::string rows;
    for (int i = 0; i < runs.shownRows(); ++i) {
        rows += (i == 0 ? "" : " ") + std::to_string(runs.rowAt(i));
        EXPECT_EQ(runs.shownAt(runs.rowAt(i)), i);
    }
    int found = 0;
    for (int row = 0; row < runs.rows(); ++row)
        found += runs.shownAt(row) ? 1 : 0;
    EXPECT_EQ(found, runs.shownRows());
    return rows;
}

TEST(LogRuns, RowsAreFoldedUnderTheirHeadings)
{
    struct Case {
        std::string_view log;
        std::string_view all;
        std::string_view kept;
        std::string_view because;
    };
    for (const Case& c :
         {Case{"", "", "", "an empty log"}, Case{"..k", "0 1 2", "2", "a log without runs"},
          Case{"H.k.", "0 1 2 3", "0 2", "one run"},
          Case{"h.k.H.", "0 4 5", "0 4", "an older one is folded"},
          Case{".kh..h.kHk", "0 1 2 5 8 9", "1 2 5 8 9", "what came before the first run"},
          Case{"hhH", "0 1 2", "0 1 2", "runs without rows"}})
        for (std::size_t inFront = 0; inFront <= c.log.size(); ++inFront) {
            const std::string because =
                std::string(c.because) + ", grown behind " + std::to_string(inFront);
            EXPECT_EQ(shown(runsOf(c.log, inFront, LogRuns::Filter::None)), c.all) << because;
            EXPECT_EQ(shown(runsOf(c.log, inFront, LogRuns::Filter::KeptRows)), c.kept) << because;
        }
}

TEST(LogRuns, TheLastRunIsShownBeforeItsBeginningIsKnown)
{
    for (const auto& [unknown, rows, because] :
         {std::tuple(8U, "8 9", "it may have begun anywhere before"),
          {7U, "7 8 9", "as it has"},
          {5U, "7 8 9", "of a run that may be folded nothing is shown"},
          {4U, "4 7 8 9", "as it is"},
          {1U, "2 3 4 7 8 9", "what may have a heading is not shown without it"},
          {0U, "0 1 2 3 4 7 8 9", "as it has none"}})
        EXPECT_EQ(shown(runsOf("..H.h..H..", 10, LogRuns::Filter::None, unknown)), rows) << because;
}

TEST(LogRuns, OpeningAndClosingMovesWhatFollows)
{
    for (const LogRuns::Filter filter : {LogRuns::Filter::None, LogRuns::Filter::KeptRows}) {
        LogRuns runs = runsOf("h.kH.khk", 5, filter);
        const bool isAll = filter == LogRuns::Filter::None;
        (void)runs.shownRows();  // what was counted is counted anew
        EXPECT_EQ(runs.rowsUnder(0), isAll ? 2 : 1);
        runs.setOpen(0, true);
        EXPECT_EQ(shown(runs), isAll ? "0 1 2 3 4 5 6" : "0 2 3 5 6");
        runs.setOpen(3, false);
        runs.setOpen(6, true);
        EXPECT_EQ(shown(runs), isAll ? "0 1 2 3 6 7" : "0 2 3 6 7");
        EXPECT_EQ(runs.headingOf(5), 3);
        EXPECT_EQ(runs.headingOf(7), 6);
        runs.addAtEnd(LogRuns::Row::Kept, false);
        EXPECT_EQ(shown(runs), isAll ? "0 1 2 3 6 7 8" : "0 2 3 6 7 8");
    }
}

}  // namespace
}  // namespace orvane::desktop
