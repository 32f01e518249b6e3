// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <chrono>
#include <functional>

namespace contract {

/// The main thread's loop. What is handed to it runs there, one after the other, in the order
/// of handing over.
class RunLoop {
public:
    using Task = std::function<void()>;
    enum class Wait { No, UntilDone };

    virtual ~RunLoop() = default;

    virtual bool isMainThread() const = 0;
    /// Any thread. `UntilDone` on the main thread itself runs the task at once.
    virtual void performOnMainThread(Task task, Wait wait) = 0;
    /// Main thread. Runs `task` once, not before `delay` has passed.
    virtual void scheduleTimer(std::chrono::duration<double> delay, Task task) = 0;
};

/// The host's threads and clock.
class Threads {
public:
    using Date = std::chrono::system_clock::time_point;

    virtual ~Threads() = default;

    /// Starts a worker thread and never waits for it. What the worker performs on the main
    /// thread is delivered in the order in which the workers were detached, so that disk images
    /// are queued in the order in which they were selected.
    virtual void detachNewThread(RunLoop::Task task) = 0;
    /// Lets the calling worker sleep until `date`. A host that attaches a disk image
    /// synchronously may wake it as soon as every disk of the image has appeared.
    virtual void sleepUntil(Date date) = 0;
    virtual Date now() const = 0;
};

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
