// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/disks/MergedHistory.h"

#include "fixwell/host/foundation/Dictionary.h"

#include <algorithm>

namespace orvane {

using fixwell::Array;
using fixwell::Value;

namespace {

bool isSameRecord(const Value& a, const Value& b)
{
    return a.dictionary().isSameAs(b.dictionary());
}

}  // namespace

bool MergedHistory::Part::hasOnlyGrown(const Array& now) const
{
    if (!now.isSameAs(history) || now.size() < size)
        return false;
    return size == 0 || (isSameRecord(first, now.front()) && isSameRecord(last, now.at(size - 1)));
}

void MergedHistory::Part::takeNew(const Array& merged)
{
    for (; size < history.size(); ++size)
        merged.append(history.at(size));
    first = history.front();
    last = history.back();
}

bool MergedHistory::canGoOn(const std::vector<Array>& histories) const
{
    return merged_ && std::equal(parts_.begin(), parts_.end(), histories.begin(), histories.end(),
                                 [](const Part& part, const Array& history) {
                                     return part.hasOnlyGrown(history);
                                 });
}

Array MergedHistory::of(const std::vector<Array>& histories)
{
    const auto hasRecords = [](const Array& history) {
        return !history.isEmpty();
    };
    // An image has no records of its own, and most have one volume.
    if (std::count_if(histories.begin(), histories.end(), hasRecords) == 1)
        return *std::find_if(histories.begin(), histories.end(), hasRecords);
    if (!canGoOn(histories)) {
        merged_ = Array::make();
        parts_.clear();
        for (const Array& history : histories)
            parts_.push_back({history, 0, {}, {}});
    }
    for (Part& part : parts_)
        part.takeNew(merged_);
    return merged_;
}

}  // namespace orvane
