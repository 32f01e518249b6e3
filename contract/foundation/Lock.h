// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>

namespace contract {

/// A lock that may be given back by one who did not get it: the message text view's writers
/// only try, go on either way, and always unlock. A standard mutex forbids that.
class Lock {
public:
    /// NO when somebody else holds the lock.
    [[nodiscard]] bool tryLock() noexcept
    {
        return !taken_.test_and_set(std::memory_order_acquire);
    }
    void unlock() noexcept { taken_.clear(std::memory_order_release); }

private:
    std::atomic_flag taken_;
};

}  // namespace contract
