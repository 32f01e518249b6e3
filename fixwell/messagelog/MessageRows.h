// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Array.h"
#include "contract/foundation/Dictionary.h"
#include "fixwell/Contract.h"

#include <cstddef>
#include <cstdint>
#include <vector>

namespace fixwell {

/// Which records of some histories, one after the other, are rows of the log, with and without
/// details.
///
/// Histories grow at the end or are replaced, so only what is new is looked at: keeping up with
/// a growing log costs the same per record however long it is, and whichever history grows.
class MessageRows {
public:
    /// Takes up the histories as they now stand.
    void update(const std::vector<Array>& histories, bool showsDetails);
    /// Forgets the histories, which may have changed in other ways than by growing.
    void invalidate();
    bool isValid() const { return isValid_; }

    /// The closing summary at the very end is no row.
    std::size_t count() const;
    /// The record in a row; none beyond the last visible record.
    Dictionary at(std::size_t row) const;

private:
    struct History {
        Array records;
        std::size_t examined = 0;            ///< records that were looked at
        std::vector<std::uint32_t> visible;  ///< their positions, when details are off
    };

    bool haveOnlyGrown(const std::vector<Array>& histories) const;
    static void findVisible(History& history);
    std::size_t visibleRecords(const History& history) const;
    bool endsWithSummary() const;

    std::vector<History> histories_;
    bool showsDetails_ = false;
    bool isValid_ = false;
};

}  // namespace fixwell
