// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <chrono>
#include <cstdint>
#include <filesystem>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

struct sqlite3;
struct sqlite3_stmt;

namespace orvane {

/// A prepared statement. Text that is bound is borrowed until the statement is run again or
/// reset; text that is read is valid until then, too. Parameters count from 1, columns from 0.
class Statement {
public:
    enum class Step { Row, Done, Failed };

    Statement() = default;
    [[nodiscard]] bool isPrepared() const { return statement_ != nullptr; }

    void bind(int parameter, std::int64_t number);
    void bind(int parameter, std::string_view text);
    void bindNothing(int parameter);

    /// The next row, or the end. After the end, or a failure, the next step starts anew.
    [[nodiscard]] Step step();
    /// Runs a statement that gives no rows.
    [[nodiscard]] bool run() { return step() == Step::Done; }
    void reset();

    [[nodiscard]] bool isNothing(int column) const;
    [[nodiscard]] std::int64_t integer(int column) const;
    [[nodiscard]] std::string_view text(int column) const;

private:
    friend class Database;
    struct Finalize {
        void operator()(sqlite3_stmt* statement) const;
    };
    explicit Statement(sqlite3_stmt* statement) : statement_(statement) {}

    std::unique_ptr<sqlite3_stmt, Finalize> statement_;
};

/// A connection to an SQLite database, or none. One thread at a time; its statements must be gone
/// before it is.
class Database {
public:
    /// What the last failure was, as far as it decides what to do next.
    enum class Trouble { None, Damaged, Locked, Other };

    Database() = default;
    /// Opens the file, which must exist; SQLite gives its companions ("-wal", "-shm") the same
    /// access rights. Not open on failure.
    static Database open(const std::filesystem::path& file);
    static Database inMemory();

    [[nodiscard]] bool isOpen() const { return database_ != nullptr; }
    [[nodiscard]] bool execute(const char* statements);
    /// Not prepared on failure.
    [[nodiscard]] Statement prepare(std::string_view statement);
    [[nodiscard]] std::int64_t lastInsertedRow() const;

    [[nodiscard]] Trouble trouble() const;
    [[nodiscard]] std::string lastError() const;
    /// Keeps what the two say now for as long as no transaction begins: undoing what failed would
    /// overwrite it.
    void keepError();
    void forgetError() { kept_.reset(); }

private:
    /// How long other programs have held the right to write.
    struct Patience {
        using Clock = std::chrono::steady_clock;
        Clock::time_point first;
        Clock::time_point last;
    };
    struct Error {
        int code = 0;
        std::string text;
    };
    static int waitOrGiveUp(void* patience, int count);
    struct Close {
        void operator()(sqlite3* database) const;
    };
    static Database opened(const char* name);

    std::unique_ptr<Patience> patience_;  ///< SQLite has its address
    std::unique_ptr<sqlite3, Close> database_;
    std::optional<Error> kept_;
};

/// Everything until `commit` comes about, or nothing does. Takes the right to write at once, so
/// that it cannot fail for that in the middle.
class Transaction {
public:
    explicit Transaction(Database& database);
    Transaction(const Transaction&) = delete;
    Transaction& operator=(const Transaction&) = delete;
    ~Transaction();

    [[nodiscard]] bool hasBegun() const { return isOpen_; }
    [[nodiscard]] bool commit();

private:
    Database& database_;
    bool isOpen_ = false;
};

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
