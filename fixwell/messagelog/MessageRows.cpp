// SPDX-License-Identifier: Apache-2.0
#include "fixwell/messagelog/MessageRows.h"

#include "fixwell/messagelog/MessageRecord.h"

namespace fixwell {

void MessageRows::update(const Array& history, bool showsDetails)
{
    const bool hasOnlyGrown = isValid_ && history.isSameAs(history_) &&
                              showsDetails == showsDetails_ && history.size() >= examined_;
    if (!hasOnlyGrown) {
        invalidate();
        history_ = history;
        showsDetails_ = showsDetails;
    }
    isValid_ = true;
    if (showsDetails_)
        examined_ = history_.size();
    else
        findVisible();
}

void MessageRows::findVisible()
{
    const std::vector<Value>& records = history_.values();
    for (; examined_ < records.size(); ++examined_)
        if (isShownInBrief(records[examined_].dictionary()))
            visible_.push_back(static_cast<std::uint32_t>(examined_));
}

void MessageRows::invalidate()
{
    isValid_ = false;
    history_ = {};
    examined_ = 0;
    visible_.clear();
}

std::size_t MessageRows::visibleRecords() const
{
    return showsDetails_ ? examined_ : visible_.size();
}

std::size_t MessageRows::count() const
{
    if (examined_ == 0 || examined_ > history_.size())
        return 0;
    const Dictionary last = history_.at(examined_ - 1).dictionary();
    const bool endsWithSummary = verbosityOf(last) == verbosity::summary;
    return visibleRecords() - (endsWithSummary ? 1 : 0);
}

Dictionary MessageRows::at(std::size_t row) const
{
    if (row >= visibleRecords())
        return {};
    return history_.at(showsDetails_ ? row : visible_[row]).dictionary();
}

}  // namespace fixwell
