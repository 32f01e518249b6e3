// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/disks/DiskHistory.h"

#include "contract/foundation/Dictionary.h"

#include <algorithm>
#include <iterator>
#include <utility>

namespace orvane {

using contract::Array;
using contract::Value;

namespace {

bool isSameRecord(const Value& a, const Value& b)
{
    return a.dictionary().isSameAs(b.dictionary());
}

/// The new records of one history, by stretches that have the same time.
class Stretches {
public:
    /// The times live longer.
    Stretches(std::size_t part, std::size_t next, std::size_t end, const RecordTimes* times)
        : part_(part), next_(next), end_(end), times_(times)
    {
    }

    std::size_t part() const { return part_; }
    bool isAtEnd() const { return next_ == end_; }
    /// What has no time yet is newer than everything that has.
    RecordTimes::Time time() const
    {
        return isDated() ? std::prev(following())->time : RecordTimes::Time::max();
    }
    /// Passes over the next stretch; where it ends.
    std::size_t takeOne()
    {
        std::size_t end = end_;
        if (isDated())
            end = following() != times_->stretches.end() ? following()->first : times_->count;
        return next_ = std::min(end, end_);
    }

private:
    bool isDated() const { return times_ != nullptr && next_ < times_->count; }
    /// The first stretch behind the next record's own.
    std::vector<RecordTimes::Stretch>::const_iterator following() const
    {
        return std::upper_bound(times_->stretches.begin(), times_->stretches.end(), next_,
                                [](std::size_t record, const RecordTimes::Stretch& stretch) {
                                    return record < stretch.first;
                                });
    }

    std::size_t part_;
    std::size_t next_;
    std::size_t end_;
    const RecordTimes* times_;
};

}  // namespace

bool MergedHistory::Part::hasOnlyGrown(const Array& now) const
{
    if (!now.isSameAs(history) || now.size() < size)
        return false;
    return size == 0 || (isSameRecord(first, now.front()) && isSameRecord(last, now.at(size - 1)));
}

void MergedHistory::Part::take(std::size_t end, const Array& merged)
{
    for (; size < end; ++size)
        merged.append(history.at(size));
    first = history.front();
    last = history.at(size - 1);
}

bool MergedHistory::canGoOn(const std::vector<Array>& histories) const
{
    return merged_ && std::equal(parts_.begin(), parts_.end(), histories.begin(), histories.end(),
                                 [](const Part& part, const Array& history) {
                                     return part.hasOnlyGrown(history);
                                 });
}

Array MergedHistory::of(const std::vector<Array>& histories, const TimesLookup& timesOf)
{
    const auto hasRecords = [](const Array& history) {
        return !history.isEmpty();
    };
    const auto count = std::count_if(histories.begin(), histories.end(), hasRecords);
    if (count == 0)
        return {};
    // An image has no records of its own, and most have one volume.
    if (count == 1)
        return *std::find_if(histories.begin(), histories.end(), hasRecords);
    if (!canGoOn(histories)) {
        merged_ = Array::make();
        parts_.clear();
        newest_ = 0;
        for (const Array& history : histories)
            parts_.push_back({history, 0, {}, {}});
    }
    takeNew(timesOf);
    return merged_;
}

void MergedHistory::takeNew(const TimesLookup& timesOf)
{
    std::vector<Stretches> ahead;
    for (std::size_t i = 0; i < parts_.size(); ++i)
        if (parts_[i].size < parts_[i].history.size())
            ahead.emplace_back(i, parts_[i].size, parts_[i].history.size(), timesOf(i));
    while (!ahead.empty()) {
        const auto next =
            std::min_element(ahead.begin(), ahead.end(), [this](const auto& a, const auto& b) {
                const auto rank = [this](const Stretches& stretches) {
                    return std::make_pair(stretches.time(), stretches.part() != newest_);
                };
                return rank(a) < rank(b);
            });
        newest_ = next->part();
        parts_[newest_].take(next->takeOne(), merged_);
        if (next->isAtEnd())
            ahead.erase(next);
    }
}

}  // namespace orvane
