// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/loop/EventLoop.h"
#include "pellar/process/FileDescriptor.h"

#include <atomic>
#include <chrono>
#include <cstdint>
#include <memory>
#include <mutex>
#include <thread>
#include <vector>

namespace orvane {

/// A main loop over poll(2), for a program without a toolkit of its own. The thread that makes
/// it is the main thread. Tasks run in the order of posting, timers by their time, and neither a
/// flood of tasks nor a busy descriptor keeps the others from their turn.
///
/// Loops may be nested: a task may call `runUntil`, and the inner loop goes on with the tasks that
/// are queued behind it.
class MainLoop final : public EventLoop {
public:
    using WatchHandler = std::function<void(short events)>;

    MainLoop();
    MainLoop(const MainLoop&) = delete;
    MainLoop& operator=(const MainLoop&) = delete;
    /// Tasks that were not run are dropped; threads that wait for one go on.
    ~MainLoop() override;

    bool isMainThread() const override;
    void scheduleTimer(std::chrono::duration<double> delay, Task task) override;
    void post(Task task) override;

    /// Calls `handler` with the events that poll(2) reports for the descriptor, which stays the
    /// caller's and must be unwatched before it is closed. One handler for each descriptor; a new
    /// one replaces it. Main thread.
    void watch(int descriptor, short events, WatchHandler handler);
    /// Effective at once, also from inside a handler. Main thread.
    void unwatch(int descriptor);

    /// Runs until `stop`. Main thread.
    void run();
    /// Makes the innermost `run` return after the task that is running. Any thread.
    void stop();
    /// Runs until `isDone` answers YES, asked before the first and after every task. Main thread.
    void runUntil(const std::function<bool()>& isDone);

private:
    using Clock = std::chrono::steady_clock;

    struct Timer {
        Clock::time_point due;
        std::uint64_t number;  ///< timers of one moment fire in the order of scheduling
        Task task;
    };
    struct Watch {
        int descriptor;
        short events;
        std::shared_ptr<const WatchHandler> handler;
    };

    void wake();
    void waitForWork();
    bool hasTasks();
    int pollTimeout();
    void serveDescriptors();
    bool runNextTask();
    bool runNextTimer(Clock::time_point now);

    const std::thread::id mainThread_ = std::this_thread::get_id();
    const pellar::FileDescriptor wakeup_;
    std::atomic<bool> isStopped_ = false;

    std::mutex lock_;
    std::vector<Task> posted_;      ///< guarded by the lock
    bool isWakeupPending_ = false;  ///< guarded by the lock

    std::vector<Task> batch_;  ///< what is being worked off
    std::size_t nextOfBatch_ = 0;
    std::vector<Timer> timers_;  ///< a heap, the next one to fire at the front
    std::uint64_t timersMade_ = 0;
    std::vector<Watch> watches_;
};

}  // namespace orvane
