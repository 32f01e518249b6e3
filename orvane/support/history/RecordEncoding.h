// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Dictionary.h"
#include "contract/foundation/StyledText.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
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

}  // namespace orvane
