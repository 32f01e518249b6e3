// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/history/RecordEncoding.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace orvane {

/// The columns of a record, and the numbers of what it has in common with others.
struct NumberedColumns {
    std::int64_t shape = 0;
    std::int64_t style = 0;  ///< 0: none
    RecordColumns columns;   ///< without the style itself
};

// A page: records one after the other in one value of a row, for a row of its own for each of a
// million records is most of what they cost. Of each its numbers, in seven bits to a byte, the
// lowest first, and its texts, each behind its length.

void addToPage(std::string& page, const NumberedColumns& record);

/// Takes the first record off the page, which keeps its texts. None where the page is damaged.
[[nodiscard]] std::optional<NumberedColumns> takeFromPage(std::string_view& page);

}  // namespace orvane
