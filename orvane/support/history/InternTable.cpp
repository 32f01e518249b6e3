// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/history/InternTable.h"

namespace orvane {

InternTable::InternTable(Database& database, const std::string& table, const std::string& column)
    : database_(database),
      find_(database.prepare("SELECT id FROM " + table + " WHERE " + column + " = ?")),
      add_(database.prepare("INSERT INTO " + table + " (" + column + ") VALUES (?)")),
      read_(database.prepare("SELECT " + column + " FROM " + table + " WHERE id = ?"))
{
}

std::int64_t InternTable::find(std::string_view text)
{
    find_.bind(1, text);
    if (find_.step() != Statement::Step::Row)
        return 0;
    const std::int64_t number = find_.integer(0);
    find_.reset();
    return number;
}

std::int64_t InternTable::intern(std::string_view text)
{
    if (const std::int64_t number = find(text))
        return number;
    add_.bind(1, text);
    return add_.run() ? database_.lastInsertedRow() : 0;
}

std::optional<std::string> InternTable::text(std::int64_t number)
{
    read_.bind(1, number);
    if (read_.step() != Statement::Step::Row)
        return std::nullopt;
    std::string text(read_.text(0));
    read_.reset();
    return text;
}

}  // namespace orvane
