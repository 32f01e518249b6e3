// SPDX-License-Identifier: Apache-2.0
#include "fixwell/messagelog/MessageRows.h"

#include "fixwell/messagelog/MessageRecord.h"

#include <algorithm>

namespace fixwell {

void MessageRows::update(const std::vector<Array>& histories, bool showsDetails)
{
    if (!isValid_ || showsDetails != showsDetails_ || !haveOnlyGrown(histories)) {
        invalidate();
        showsDetails_ = showsDetails;
        for (const Array& history : histories)
            histories_.push_back({history, 0, {}});
    }
    isValid_ = true;
    for (History& history : histories_)
        if (showsDetails_)
            history.examined = history.records.size();
        else
            findVisible(history);
}

bool MessageRows::haveOnlyGrown(const std::vector<Array>& histories) const
{
    return std::equal(histories_.begin(), histories_.end(), histories.begin(), histories.end(),
                      [](const History& before, const Array& now) {
                          return now.isSameAs(before.records) && now.size() >= before.examined;
                      });
}

void MessageRows::findVisible(History& history)
{
    const std::vector<Value>& records = history.records.values();
    for (; history.examined < records.size(); ++history.examined)
        if (isShownInBrief(records[history.examined].dictionary()))
            history.visible.push_back(static_cast<std::uint32_t>(history.examined));
}

void MessageRows::invalidate()
{
    isValid_ = false;
    histories_.clear();
}

std::size_t MessageRows::visibleRecords(const History& history) const
{
    return showsDetails_ ? history.examined : history.visible.size();
}

bool MessageRows::endsWithSummary() const
{
    const auto last = std::find_if(histories_.rbegin(), histories_.rend(),
                                   [](const History& history) { return history.examined != 0; });
    return last != histories_.rend() && last->examined <= last->records.size() &&
           verbosityOf(last->records.at(last->examined - 1).dictionary()) == verbosity::summary;
}

std::size_t MessageRows::count() const
{
    std::size_t count = 0;
    for (const History& history : histories_)
        if (history.examined <= history.records.size())
            count += visibleRecords(history);
    return count - (endsWithSummary() ? 1 : 0);
}

Dictionary MessageRows::at(std::size_t row) const
{
    for (const History& history : histories_) {
        const std::size_t visible = visibleRecords(history);
        if (row < visible)
            return history.records.at(showsDetails_ ? row : history.visible[row]).dictionary();
        row -= visible;
    }
    return {};
}

}  // namespace fixwell
