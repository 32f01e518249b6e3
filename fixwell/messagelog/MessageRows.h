// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/host/foundation/Array.h"
#include "fixwell/host/foundation/Dictionary.h"

#include <cstddef>
#include <cstdint>
#include <vector>

namespace fixwell {

/// Which records of a history are rows of the log, with and without details.
///
/// Histories grow at the end or are replaced, so only what is new is looked at: keeping up with
/// a growing log costs the same per record however long it is.
class MessageRows {
public:
    /// Takes up the history as it now stands.
    void update(const Array& history, bool showsDetails);
    /// Forgets the history, which may have changed in other ways than by growing.
    void invalidate();
    bool isValid() const { return isValid_; }

    /// The closing summary at the very end is no row.
    std::size_t count() const;
    /// The record in a row; none beyond the last visible record.
    Dictionary at(std::size_t row) const;

private:
    void findVisible();
    std::size_t visibleRecords() const;

    Array history_;
    bool showsDetails_ = false;
    bool isValid_ = false;
    std::size_t examined_ = 0;            ///< records of the history that were looked at
    std::vector<std::uint32_t> visible_;  ///< their positions, when details are off
};

}  // namespace fixwell
