// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/toolkit/LogModel.h"
#include "orvane/desktop/toolkit/LogTable.h"

#include <optional>
#include <utility>
#include <vector>

namespace orvane::desktop {

/// Where the reader of a log is: which rows are in sight, and which are selected. Rows are known
/// by their records, so that the place is found again when rows were added between them, or when
/// details came or went. Main thread.
class LogPlace {
public:
    /// Nowhere: at the end of an empty log.
    LogPlace() = default;
    /// Taken while the view still answers the rows that the table shows. Costs as much as the
    /// rows in sight and the selected stretches.
    LogPlace(const LogTable& table, const LogModel& model);

    /// The last row was in sight, so that the next ones are expected there, too.
    bool isAtEnd() const { return isAtEnd_; }
    /// Selects again what was selected, as far as it is there.
    void restoreSelection(LogTable& table, const LogModel& model) const;
    /// Brings a row back to where it was in the table; NO when none of the rows is there any more.
    bool restoreSight(LogTable& table, const LogModel& model) const;

private:
    struct Row {
        int number;
        contract::OutlineItem item;
    };
    struct SightedRow {
        Row row;
        int top;  ///< pixels, from the top of the viewport
    };
    struct Stretch {
        Row first;
        Row last;
    };

    std::optional<int> find(const LogModel& model, const Row& row) const;

    bool isAtEnd_ = true;
    int rows_ = 0;
    std::vector<SightedRow> inSight_;
    std::vector<Stretch> selected_;
    std::optional<Row> current_;
};

}  // namespace orvane::desktop
