// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/history/Checkpointer.h"

#include "orvane/support/history/Database.h"

#include <system_error>
#include <utility>

namespace orvane {

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
