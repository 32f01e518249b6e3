// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <condition_variable>
#include <filesystem>
#include <mutex>
#include <thread>

namespace orvane {

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
