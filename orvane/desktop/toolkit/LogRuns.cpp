// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/LogRuns.h"

#include <algorithm>
#include <functional>

namespace orvane::desktop {

void LogRuns::begin(int rows, Filter filter)
{
    filter_ = filter;
    known_ = rows;
    end_ = rows;
    runs_.clear();
    keptInFront_.clear();
    hasFoundHeading_ = false;
    offsets_.clear();
}

void LogRuns::addInFront(Row row, bool isOpen)
{
    --known_;
    if (row == Row::Heading) {
        runs_.push_front({known_, isOpen, {keptInFront_.rbegin(), keptInFront_.rend()}});
        keptInFront_.clear();
        hasFoundHeading_ = true;
        offsets_.clear();
    } else if (row == Row::Kept && filter_ == Filter::KeptRows) {
        keptInFront_.push_back(known_);
    }
}

void LogRuns::addAtEnd(Row row, bool isOpen)
{
    const int added = end_++;
    if (row == Row::Heading)
        runs_.push_back({added, isOpen, {}});
    else if (row == Row::Kept && filter_ == Filter::KeptRows && runs_.empty())
        keptInFront_.insert(keptInFront_.begin(), added);
    else if (row == Row::Kept && filter_ == Filter::KeptRows)
        runs_.back().kept.push_back(added);
}

int LogRuns::rowsInFront() const
{
    return (runs_.empty() ? end_ : runs_.front().heading) - known_;
}

// Of a run whose heading is not known yet nothing is shown, because it may be folded; but the last
// one, with which a log begins to be shown.
int LogRuns::shownInFront() const
{
    if (hasFoundHeading_ && known_ > 0)
        return 0;
    return filter_ == Filter::None ? rowsInFront() : static_cast<int>(keptInFront_.size());
}

int LogRuns::endOf(std::size_t run) const
{
    return run + 1 < runs_.size() ? runs_[run + 1].heading : end_;
}

int LogRuns::rowsUnder(int heading) const
{
    const std::size_t run = indexOf(heading);
    return filter_ == Filter::None ? endOf(run) - runs_[run].heading - 1
                                   : static_cast<int>(runs_[run].kept.size());
}

// The runs that were counted stay as they are while the last one grows and others follow.
void LogRuns::settleOffsets() const
{
    for (std::size_t run = offsets_.size(); run < runs_.size(); ++run) {
        if (run == 0) {
            offsets_.push_back(0);
            continue;
        }
        const Run& before = runs_[run - 1];
        offsets_.push_back(offsets_[run - 1] + 1 + (before.isOpen ? rowsUnder(before.heading) : 0));
    }
}

int LogRuns::shownRows() const
{
    if (runs_.empty())
        return shownInFront();
    settleOffsets();
    const Run& last = runs_.back();
    return shownInFront() + offsets_.back() + 1 + (last.isOpen ? rowsUnder(last.heading) : 0);
}

int LogRuns::rowAt(int shown) const
{
    const int inFront = shownInFront();
    if (shown < inFront)
        return filter_ == Filter::None
                   ? known_ + shown
                   : keptInFront_[keptInFront_.size() - 1 - static_cast<std::size_t>(shown)];
    settleOffsets();
    const int place = shown - inFront;
    const auto behind = std::upper_bound(offsets_.begin(), offsets_.end(), place);
    const auto run = static_cast<std::size_t>(behind - offsets_.begin()) - 1;
    const int within = place - offsets_[run];
    if (within == 0 || filter_ == Filter::None)
        return runs_[run].heading + within;
    return runs_[run].kept[static_cast<std::size_t>(within) - 1];
}

/// Of a row that is not in front of the first heading.
std::size_t LogRuns::indexOf(int row) const
{
    const auto behind =
        std::upper_bound(runs_.begin(), runs_.end(), row,
                         [](int number, const Run& run) { return number < run.heading; });
    return static_cast<std::size_t>(behind - runs_.begin()) - 1;
}

std::optional<int> LogRuns::shownAt(int row) const
{
    if (row < known_ || row >= end_)
        return std::nullopt;
    if (runs_.empty() || row < runs_.front().heading) {
        if (shownInFront() == 0)
            return std::nullopt;
        if (filter_ == Filter::None)
            return row - known_;
        const auto kept = std::lower_bound(keptInFront_.rbegin(), keptInFront_.rend(), row);
        return kept != keptInFront_.rend() && *kept == row
                   ? std::optional(static_cast<int>(kept - keptInFront_.rbegin()))
                   : std::nullopt;
    }
    settleOffsets();
    const std::size_t index = indexOf(row);
    const Run& run = runs_[index];
    const int heading = shownInFront() + offsets_[index];
    if (row == run.heading)
        return heading;
    if (!run.isOpen)
        return std::nullopt;
    if (filter_ == Filter::None)
        return heading + row - run.heading;
    const auto kept = std::lower_bound(run.kept.begin(), run.kept.end(), row);
    return kept != run.kept.end() && *kept == row
               ? std::optional(heading + 1 + static_cast<int>(kept - run.kept.begin()))
               : std::nullopt;
}

std::optional<int> LogRuns::headingOf(int row) const
{
    if (runs_.empty() || row < runs_.front().heading || row >= end_)
        return std::nullopt;
    return runs_[indexOf(row)].heading;
}

std::optional<int> LogRuns::lastHeading() const
{
    return runs_.empty() ? std::nullopt : std::optional(runs_.back().heading);
}

bool LogRuns::isOpen(int heading) const
{
    return runs_[indexOf(heading)].isOpen;
}

void LogRuns::setOpen(int heading, bool isOpen)
{
    const std::size_t run = indexOf(heading);
    runs_[run].isOpen = isOpen;
    offsets_.resize(std::min(offsets_.size(), run + 1));
}

}  // namespace orvane::desktop
