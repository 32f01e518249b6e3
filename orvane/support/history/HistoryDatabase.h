// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/files/Failure.h"
#include "orvane/support/history/Database.h"

#include <condition_variable>
#include <filesystem>
#include <mutex>
#include <thread>

namespace orvane {

// The history database: application_id and user_version say whose it is and how it is laid out.
//
//   volumes   key, one row for each volume
//   styles    the looks of text as JSON, interned
//   shapes    which keys a record has, in which order, and where their values are, interned
//   records   id = volume * 2^36 + number of the record within the volume, so a volume's records
//             lie together in their order, and appending needs no index; records that were saved
//             together follow the first of them on its page, and have the numbers behind its own
//   runs      what was done with a volume and how it ended

/// A history database that is ready for use, and whether it is kept in the file.
struct HistoryDatabase {
    Database database;
    bool isKept = false;
};

/// Opens the database, or makes it. One that is damaged is kept aside as NAME.broken-TIME, and a
/// new one is begun; one that cannot be used (locked, unwritable, made by a newer version) is left
/// alone, and an empty one in memory stands in for it. Each is said through the warning sink.
/// An empty path asks for one in memory.
[[nodiscard]] HistoryDatabase openHistory(const std::filesystem::path& file,
                                          const WarningSink& warn);

/// Moves a damaged database out of the way; YES when a new one can be begun in its place. It must
/// not be open any more.
[[nodiscard]] bool setHistoryAside(const std::filesystem::path& file, const WarningSink& warn);

/// Carries what stands in a database's write-ahead log over into the database, on a thread and a
/// connection of its own: that waits for the disk, which the main thread must not do while a tool
/// prints (https://sqlite.org/wal.html, "Performance Considerations").
class Checkpointer {
public:
    explicit Checkpointer(std::filesystem::path database) : database_(std::move(database)) {}
    Checkpointer(const Checkpointer&) = delete;
    Checkpointer& operator=(const Checkpointer&) = delete;
    /// Waits for the checkpoint that is under way.
    ~Checkpointer();

    /// Soon, once for all requests until then. Where no thread can be had nothing happens: SQLite
    /// itself does it in the end.
    void request();

private:
    void work(const std::stop_token& stop);

    const std::filesystem::path database_;
    std::mutex lock_;
    std::condition_variable_any changed_;
    bool isRequested_ = false;
    std::jthread thread_;
};

}  // namespace orvane
