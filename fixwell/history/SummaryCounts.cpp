// SPDX-License-Identifier: Apache-2.0
#include "fixwell/history/SummaryCounts.h"

#include "fixwell/messagelog/MessageRecord.h"

#include <array>

namespace fixwell {

Dictionary makeSummaryRecord(const Array& history)
{
    const std::array types{kFsckVerify, kFsckRepair, kFsckError, kFsckSuccess, kFsckFail};
    std::array<std::int64_t, types.size()> counts{};
    for (auto record = history.values().rbegin(); record != history.values().rend(); ++record) {
        const Dictionary message = record->dictionary();
        if (verbosityOf(message) < verbosity::main)
            break;
        for (std::size_t i = 0; i < types.size(); ++i)
            counts[i] += message.string(kFsckMessageType) == types[i].text() ? 1 : 0;
    }

    const Dictionary summary =
        Dictionary::of({{kOV_finalAttributedString_type, StyledText::make("\n")},
                        {kFsckVerbosity, verbosity::summary}});
    for (std::size_t i = 0; i < types.size(); ++i)
        summary.set(types[i], counts[i]);
    return summary;
}

}  // namespace fixwell
