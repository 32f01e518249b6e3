// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/history/HistoryDatabase.h"

#include "orvane/support/files/WholeFile.h"
#include "orvane/support/history/Database.h"
#include "pellar/process/FileDescriptor.h"

#include <fcntl.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <ctime>
#include <string>
#include <system_error>
#include <utility>

namespace orvane {
namespace {

constexpr std::int64_t layoutVersion = 2;

// "Orvh" in ASCII: tells file(1) and us that the database is a history.
constexpr const char* layout = R"(
    PRAGMA application_id = 0x4F727668;
    CREATE TABLE volumes (id INTEGER PRIMARY KEY, key BLOB NOT NULL UNIQUE);
    CREATE TABLE styles (id INTEGER PRIMARY KEY, style TEXT NOT NULL UNIQUE);
    CREATE TABLE shapes (id INTEGER PRIMARY KEY, shape TEXT NOT NULL UNIQUE);
    CREATE TABLE records (id INTEGER PRIMARY KEY, shape INTEGER NOT NULL, type TEXT,
                          verbosity INTEGER, message TEXT, text TEXT, style INTEGER,
                          time INTEGER NOT NULL, extra TEXT, pageRecords INTEGER, page BLOB);
    CREATE TABLE runs (id INTEGER PRIMARY KEY, volume INTEGER NOT NULL, started INTEGER NOT NULL,
                       finished INTEGER, action TEXT NOT NULL, verdict TEXT, error INTEGER,
                       message TEXT);
    CREATE INDEX runsOfVolume ON runs (volume, started);
    PRAGMA user_version = 2;
)";

// A program of before would show the first record of a page alone.
constexpr const char* fromFirstLayout =
    "ALTER TABLE records ADD COLUMN pageRecords INTEGER;"
    "ALTER TABLE records ADD COLUMN page BLOB;"
    "PRAGMA user_version = 2";

// The index finds where runs end without reading every record between. The table has the runs that
// have no end yet, with the process that they are of.
constexpr const char* laterAdditions =
    "CREATE INDEX IF NOT EXISTS summaries ON records (id) WHERE verbosity = -2;"
    "CREATE TABLE IF NOT EXISTS openRuns (run INTEGER PRIMARY KEY, owner TEXT NOT NULL)";

// A program of before them reads and writes the table as it did.
constexpr std::array<std::array<const char*, 2>, 4> laterColumnsOfRuns{
    {{"tool", "ALTER TABLE runs ADD COLUMN tool TEXT"},
     {"problems", "ALTER TABLE runs ADD COLUMN problems INTEGER"},
     {"problemKinds", "ALTER TABLE runs ADD COLUMN problemKinds INTEGER"},
     {"losses", "ALTER TABLE runs ADD COLUMN losses INTEGER"}}};

// WAL lets other programs read while one writes. With synchronous = NORMAL what was saved survives
// the end of the program, however it comes; a power failure may take the last moments. Checkpoints
// have a thread of their own; SQLite makes one itself only when a quarter of a gigabyte waits.
constexpr const char* settings =
    "PRAGMA journal_mode = WAL; PRAGMA synchronous = NORMAL; PRAGMA cache_size = -8000;"
    "PRAGMA journal_size_limit = 16777216; PRAGMA wal_autocheckpoint = 65536";

// Reads a little of every table, which opening alone does not.
constexpr const char* probe =
    "SELECT 1 FROM volumes LIMIT 1; SELECT 1 FROM styles LIMIT 1; SELECT 1 FROM shapes LIMIT 1;"
    "SELECT 1 FROM records LIMIT 1; SELECT 1 FROM runs LIMIT 1";

enum class Condition { Ready, Damaged, Unusable };

Condition conditionOf(const Database& database)
{
    return database.trouble() == Database::Trouble::Damaged ? Condition::Damaged
                                                            : Condition::Unusable;
}

bool readVersion(Database& database, std::int64_t& version)
{
    Statement statement = database.prepare("PRAGMA user_version");
    if (!statement.isPrepared() || statement.step() != Statement::Step::Row)
        return false;
    version = statement.integer(0);
    return true;
}

bool hasColumnOfRuns(Database& database, std::string_view name)
{
    Statement statement =
        database.prepare("SELECT 1 FROM pragma_table_info('runs') WHERE name = ?");
    statement.bind(1, name);
    return statement.step() == Statement::Step::Row;
}

bool hasAllColumnsOfRuns(Database& database)
{
    return std::all_of(
        laterColumnsOfRuns.begin(), laterColumnsOfRuns.end(),
        [&database](const auto& column) { return hasColumnOfRuns(database, column[0]); });
}

/// What a database of an earlier program lacks. Another program may be adding it, hence the second
/// look.
bool addColumnsOfRuns(Database& database)
{
    if (hasAllColumnsOfRuns(database))
        return true;
    Transaction transaction(database);
    bool isDone = transaction.hasBegun();
    for (const auto& [name, addition] : laterColumnsOfRuns)
        isDone = isDone && (hasColumnOfRuns(database, name) || database.execute(addition));
    return isDone && transaction.commit();
}

/// Makes the tables, or makes those of an earlier program ours. Another program may be doing it,
/// hence the second look.
bool makeLayout(Database& database, std::int64_t& version)
{
    if (version >= layoutVersion)
        return true;
    Transaction transaction(database);
    return transaction.hasBegun() && readVersion(database, version) &&
           (version != 0 || database.execute(layout)) &&
           (version != 1 || database.execute(fromFirstLayout)) && transaction.commit() &&
           readVersion(database, version);
}

Condition makeReady(Database& database, std::string& reason)
{
    std::int64_t version = 0;
    bool isReady = database.isOpen() && database.execute(settings) &&
                   readVersion(database, version) && makeLayout(database, version);
    isReady = isReady && database.execute(probe) &&
              (version != layoutVersion ||
               (database.execute(laterAdditions) && addColumnsOfRuns(database)));
    if (isReady && version == layoutVersion)
        return Condition::Ready;
    reason = isReady ? "it was made by a newer version" : database.lastError();
    return isReady ? Condition::Unusable : conditionOf(database);
}

// Made by us first, because SQLite would make it readable by all.
int createPrivateFile(const std::filesystem::path& file)
{
    const pellar::FileDescriptor made(
        ::open(file.c_str(), O_RDWR | O_CREAT | O_CLOEXEC | O_NONBLOCK | O_NOFOLLOW, 0600));
    return made ? 0 : errno;
}

HistoryDatabase inMemory()
{
    HistoryDatabase history{Database::inMemory(), false};
    std::string ignored;
    static_cast<void>(makeReady(history.database, ignored));
    return history;
}

HistoryDatabase inMemoryBecause(const std::filesystem::path& file, const std::string& reason,
                                const WarningSink& warn)
{
    warn(cannot("use the history", file.native(), reason).message +
         "; it is kept until the program ends");
    return inMemory();
}

}  // namespace

bool setHistoryAside(const std::filesystem::path& file, const WarningSink& warn)
{
    const std::string aside = file.native() + ".broken-" + std::to_string(std::time(nullptr));
    std::error_code error;
    std::filesystem::rename(file, aside, error);
    // The companions belong to the old database and would damage the new one.
    for (const char* const companion : {"-wal", "-shm"}) {
        std::error_code ignored;
        std::filesystem::rename(file.native() + companion, aside + companion, ignored);
    }
    if (!error)
        warn(cannot("read the history", file.native(),
                    "it is damaged; it is kept as ‘" + aside + "’, and a new one is begun")
                 .message);
    return !error;
}

HistoryDatabase openHistory(const std::filesystem::path& file, const WarningSink& warn)
{
    if (file.empty())
        return inMemory();
    if (const auto directory = createPrivateDirectory(file.parent_path()); !directory)
        return inMemoryBecause(file, directory.error().message, warn);

    std::string reason;
    for (int attempt = 0; attempt < 2; ++attempt) {
        if (const int error = createPrivateFile(file))
            return inMemoryBecause(file, errorText(error), warn);
        Database database = Database::open(file);
        if (!database.isOpen())
            return inMemoryBecause(file, "SQLite cannot open it", warn);
        const Condition condition = makeReady(database, reason);
        if (condition == Condition::Ready)
            return {std::move(database), true};
        database = Database();
        if (condition != Condition::Damaged || !setHistoryAside(file, warn))
            break;
    }
    return inMemoryBecause(file, reason, warn);
}

Checkpointer::~Checkpointer()
{
    thread_.request_stop();
}

void Checkpointer::request()
{
    {
        const std::lock_guard guard(lock_);
        isRequested_ = true;
    }
    changed_.notify_one();
    if (thread_.joinable())
        return;
    try {
        thread_ = std::jthread([this](const std::stop_token& stop) { work(stop); });
    } catch (const std::system_error&) {
        // Asked again the next time.
    }
}

void Checkpointer::work(const std::stop_token& stop)
{
    Database database = Database::open(database_);
    std::unique_lock guard(lock_);
    while (changed_.wait(guard, stop, [this] { return isRequested_; })) {
        isRequested_ = false;
        guard.unlock();
        // Passive: neither waits for those who read or write, nor makes them wait.
        if (database.isOpen())
            static_cast<void>(database.execute("PRAGMA wal_checkpoint(PASSIVE)"));
        guard.lock();
    }
}

}  // namespace orvane
