// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Dictionary.h"
#include "orvane/support/history/InternTable.h"
#include "orvane/support/history/RecordEncoding.h"

#include <cstdint>
#include <deque>
#include <map>
#include <unordered_map>

namespace orvane {

/// What records have in common, written once: the looks of their text and their shapes. Remembers
/// what the tables hold. The database outlives this object.
class RecordVocabulary {
public:
    struct NumberedShape {
        RecordShape shape;
        std::int64_t number;
    };

    explicit RecordVocabulary(Database& database);

    /// The shape that fits the record, until the next call; null when it could not be written.
    [[nodiscard]] const NumberedShape* shapeOf(const contract::Dictionary& record);
    /// 0 when it could not be written.
    [[nodiscard]] std::int64_t numberOf(const contract::TextStyle* style);

    // What was written under these numbers; an empty one when that is unreadable.
    [[nodiscard]] const contract::TextStyle* style(std::int64_t number);
    [[nodiscard]] const RecordShape& shape(std::int64_t number);

    /// After a transaction that failed: what was written in it is not in the tables.
    void forget();

private:
    InternTable styles_;
    InternTable shapes_;

    std::deque<NumberedShape> shapesWritten_;
    std::unordered_map<const contract::TextStyle*, std::int64_t> stylesWritten_;
    std::map<std::int64_t, contract::TextStyle> stylesRead_;
    std::map<std::int64_t, RecordShape> shapesRead_;
};

}  // namespace orvane
