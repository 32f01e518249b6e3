// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Dictionary.h"
#include "contract/foundation/StyledText.h"
#include "orvane/support/history/Database.h"

#include <cstdint>
#include <deque>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace orvane {

/// Where the value of one key of a record is stored.
enum class RecordSlot : char {
    Type = 'T',       ///< the message type
    Verbosity = 'V',  ///< an integer
    Message = 'M',    ///< the message as the library sent it
    Text = 'S',       ///< the final text, in one style
    Origin = 'O',     ///< one of the known origins, told by the shape itself
    Extra = 'X',      ///< anything else, as JSON
};

/// The keys of a record in their order, with the slots of their values. Records are many and
/// shapes are few, so a record names its shape, and what the shape says need not be stored.
struct RecordShape {
    struct Entry {
        contract::Name key;
        RecordSlot slot;
        contract::Value origin;  ///< for the slot Origin
    };
    std::vector<Entry> entries;

    [[nodiscard]] static RecordShape of(const contract::Dictionary& record);
    [[nodiscard]] bool fits(const contract::Dictionary& record) const;
    [[nodiscard]] std::string toJSON() const;
    /// None for text that is no shape.
    [[nodiscard]] static std::optional<RecordShape> fromJSON(std::string_view text);
};

/// The columns of a record. Texts are borrowed from the record, or from the row that was read.
struct RecordColumns {
    std::string_view type;
    std::int64_t verbosity = 0;
    std::string_view message;
    std::string_view text;
    const contract::TextStyle* style = nullptr;
    std::string_view extra;
};

/// Takes the record apart; `extra` is given room in `room`.
[[nodiscard]] RecordColumns columnsOf(const contract::Dictionary& record, const RecordShape& shape,
                                      std::string& room);
/// The record again: the same keys in the same order with values of the same kinds.
[[nodiscard]] contract::Dictionary recordFrom(const RecordColumns& columns,
                                              const RecordShape& shape);

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
