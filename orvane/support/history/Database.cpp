// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/history/Database.h"

#include <sqlite3.h>

namespace orvane {
namespace {

// How long another program may hold the right to write before we give up.
constexpr int patienceMilliseconds = 3000;

}  // namespace

void Statement::Finalize::operator()(sqlite3_stmt* statement) const
{
    sqlite3_finalize(statement);
}

void Statement::bind(int parameter, std::int64_t number)
{
    sqlite3_bind_int64(statement_.get(), parameter, number);
}

// A null pointer would bind NULL, which is something else than the empty text.
void Statement::bind(int parameter, std::string_view text)
{
    sqlite3_bind_text64(statement_.get(), parameter, text.data() != nullptr ? text.data() : "",
                        text.size(), SQLITE_STATIC, SQLITE_UTF8);
}

void Statement::bindNothing(int parameter)
{
    sqlite3_bind_null(statement_.get(), parameter);
}

Statement::Step Statement::step()
{
    const int result = sqlite3_step(statement_.get());
    if (result == SQLITE_ROW)
        return Step::Row;
    reset();
    return result == SQLITE_DONE ? Step::Done : Step::Failed;
}

void Statement::reset()
{
    sqlite3_reset(statement_.get());
}

bool Statement::isNothing(int column) const
{
    return sqlite3_column_type(statement_.get(), column) == SQLITE_NULL;
}

std::int64_t Statement::integer(int column) const
{
    return sqlite3_column_int64(statement_.get(), column);
}

std::string_view Statement::text(int column) const
{
    const auto* const text =
        reinterpret_cast<const char*>(sqlite3_column_text(statement_.get(), column));
    const int size = sqlite3_column_bytes(statement_.get(), column);
    return text != nullptr ? std::string_view(text, static_cast<std::size_t>(size))
                           : std::string_view();
}

void Database::Close::operator()(sqlite3* database) const
{
    sqlite3_close_v2(database);
}

Database Database::opened(const char* name)
{
    Database result;
    sqlite3* database = nullptr;
    const int flags = SQLITE_OPEN_READWRITE | SQLITE_OPEN_NOMUTEX | SQLITE_OPEN_EXRESCODE;
    const int error = sqlite3_open_v2(name, &database, flags, nullptr);
    result.database_.reset(database);
    if (error != SQLITE_OK)
        result.database_.reset();
    else
        sqlite3_busy_timeout(database, patienceMilliseconds);
    return result;
}

Database Database::open(const std::filesystem::path& file)
{
    return opened(file.c_str());
}

Database Database::inMemory()
{
    return opened(":memory:");
}

bool Database::execute(const char* statements)
{
    return sqlite3_exec(database_.get(), statements, nullptr, nullptr, nullptr) == SQLITE_OK;
}

Statement Database::prepare(std::string_view text)
{
    sqlite3_stmt* statement = nullptr;
    sqlite3_prepare_v3(database_.get(), text.data(), static_cast<int>(text.size()),
                       SQLITE_PREPARE_PERSISTENT, &statement, nullptr);
    return Statement(statement);
}

std::int64_t Database::lastInsertedRow() const
{
    return sqlite3_last_insert_rowid(database_.get());
}

Database::Trouble Database::trouble() const
{
    switch (sqlite3_errcode(database_.get()) & 0xFF) {
        case SQLITE_OK:
        case SQLITE_ROW:
        case SQLITE_DONE: return Trouble::None;
        case SQLITE_CORRUPT:
        case SQLITE_NOTADB: return Trouble::Damaged;
        case SQLITE_BUSY:
        case SQLITE_LOCKED: return Trouble::Locked;
        default: return Trouble::Other;
    }
}

std::string Database::lastError() const
{
    return sqlite3_errmsg(database_.get());
}

Transaction::Transaction(Database& database)
    : database_(database), isOpen_(database.execute("BEGIN IMMEDIATE"))
{
}

// A failed statement may have rolled everything back already; then there is nothing left to undo.
Transaction::~Transaction()
{
    if (isOpen_)
        static_cast<void>(database_.execute("ROLLBACK"));
}

bool Transaction::commit()
{
    if (!database_.execute("COMMIT"))
        return false;
    isOpen_ = false;
    return true;
}

}  // namespace orvane
