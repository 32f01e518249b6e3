// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <deque>
#include <optional>
#include <vector>

namespace orvane::desktop {

/// Which rows of a log are shown, where those of a run can be folded under the run's first row,
/// its heading. Rows go by their numbers in the log; shown rows by theirs on the screen.
///
/// The rows are told one by one, from the last one to the first and, as the log grows, behind the
/// last one, so that a long log is there with its end and its beginning follows. Looking a row up
/// costs the logarithm of the number of runs; folding one, the number of runs.
class LogRuns {
public:
    enum class Row {
        Heading,  ///< a run begins with it
        Kept,     ///< is shown also where the rows are filtered
        Other,
    };
    /// Which rows below an open heading are shown.
    enum class Filter { None, KeptRows };

    /// Forgets all; a log of so many rows, none of which is known yet.
    void begin(int rows, Filter filter = Filter::None);
    /// The rows that are not known yet are the first ones, up to this.
    int unknown() const { return known_; }
    int rows() const { return end_; }

    /// Of row `unknown() - 1`. `isOpen` is of a heading.
    void addInFront(Row row, bool isOpen);
    /// Of row `rows()`.
    void addAtEnd(Row row, bool isOpen);

    int shownRows() const;
    /// The row that is shown there.
    int rowAt(int shown) const;
    /// Where the row is shown; none where it is not.
    std::optional<int> shownAt(int row) const;

    /// The heading above the row, or in it; none where its run has none, or it is not known yet.
    std::optional<int> headingOf(int row) const;
    /// The heading of the last run.
    std::optional<int> lastHeading() const;
    bool isHeading(int row) const { return headingOf(row) == row; }
    /// Of a heading.
    bool isOpen(int heading) const;
    void setOpen(int heading, bool isOpen);
    /// How many rows are folded under the heading, or would be.
    int rowsUnder(int heading) const;

private:
    struct Run {
        int heading = 0;
        bool isOpen = false;
        std::vector<int> kept;  ///< where the rows are filtered
    };

    std::size_t indexOf(int row) const;
    int endOf(std::size_t run) const;
    int rowsInFront() const;
    int shownInFront() const;
    void settleOffsets() const;

    Filter filter_ = Filter::None;
    int known_ = 0;  ///< the first row that is known
    int end_ = 0;
    std::deque<Run> runs_;
    std::vector<int> keptInFront_;  ///< before the first heading, the last one first
    bool hasFoundHeading_ = false;  ///< looking from the end to the front
    /// Shown rows before each run, from the first heading on; runs beyond its size are not counted.
    mutable std::vector<int> offsets_;
};

}  // namespace orvane::desktop
