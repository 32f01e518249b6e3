// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/history/Database.h"

#include <sqlite3.h>

#include <thread>

namespace orvane {
namespace {

using namespace std::chrono_literals;

// Another program may hold the right to write for so long; then every attempt gives up at once
// until it is free. A check does not wait for its history once for each record.
constexpr auto longestWait = 2s;
// What was free for so long is held anew.
constexpr auto newBeginning = 10s;

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
    const int flags =
        SQLITE_OPEN_READWRITE | SQLITE_OPEN_NOMUTEX | SQLITE_OPEN_EXRESCODE | SQLITE_OPEN_NOFOLLOW;
    const int error = sqlite3_open_v2(name, &database, flags, nullptr);
    result.database_.reset(database);
    if (error != SQLITE_OK) {
        result.database_.reset();
        return result;
    }
    result.patience_ = std::make_unique<Patience>();
    sqlite3_busy_handler(database, waitOrGiveUp, result.patience_.get());
    return result;
}

int Database::waitOrGiveUp(void* patience, int /*count*/)
{
    auto& waited = *static_cast<Patience*>(patience);
    const auto now = Patience::Clock::now();
    if (now - waited.last > newBeginning)
        waited.first = now;
    waited.last = now;
    if (now - waited.first > longestWait)
        return 0;
    std::this_thread::sleep_for(10ms);
    return 1;
}

Database Database::open(const std::filesystem::path& file)
{
    // The directory may be reached through links, the file itself may be none.
    std::error_code error;
    const auto directory = std::filesystem::canonical(file.parent_path(), error);
    return error ? Database() : opened((directory / file.filename()).c_str());
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
    switch ((kept_ ? kept_->code : sqlite3_errcode(database_.get())) & 0xFF) {
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
    return kept_ ? kept_->text : sqlite3_errmsg(database_.get());
}

void Database::keepError()
{
    kept_ = {sqlite3_extended_errcode(database_.get()), sqlite3_errmsg(database_.get())};
}

Transaction::Transaction(Database& database) : database_(database)
{
    database_.forgetError();
    isOpen_ = database_.execute("BEGIN IMMEDIATE");
}

// A failed statement may have rolled everything back already; then there is nothing left to undo.
Transaction::~Transaction()
{
    if (!isOpen_)
        return;
    database_.keepError();
    static_cast<void>(database_.execute("ROLLBACK"));
}

bool Transaction::commit()
{
    if (!database_.execute("COMMIT"))
        return false;
    isOpen_ = false;
    return true;
}

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
