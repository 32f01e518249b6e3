// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/history/Database.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace orvane {

/// A table of texts, each in it once, that other tables name by numbers. Numbers begin with 1. The
/// database outlives this object.
class InternTable {
public:
    /// The column is unique. Both names are ours, never a user's.
    InternTable(Database& database, const std::string& table, const std::string& column);

    /// 0 where the table has no such text; writes nothing.
    [[nodiscard]] std::int64_t find(std::string_view text);
    /// 0 where it could not be written.
    [[nodiscard]] std::int64_t intern(std::string_view text);
    [[nodiscard]] std::optional<std::string> text(std::int64_t number);

private:
    Database& database_;
    Statement find_;
    Statement add_;
    Statement read_;
};

}  // namespace orvane
