// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/loop/EventLoop.h"

#include <QObject>
#include <QTimer>

#include <deque>
#include <mutex>

namespace orvane::desktop {

/// The main loop on Qt's event loop. The thread that makes it, with the application object there
/// already, is the main thread. Tasks run in the order of posting, a few milliseconds' worth at a
/// time, so that a tool that floods the program with lines leaves the window usable.
///
/// Event loops may be nested, as a dialog's is: it goes on with the tasks that are queued behind
/// the one that opened it.
class QtLoop final : public EventLoop {
public:
    QtLoop();
    QtLoop(const QtLoop&) = delete;
    QtLoop& operator=(const QtLoop&) = delete;
    /// Tasks that were not run are dropped; threads that wait for one go on. No other thread may
    /// post any more.
    ~QtLoop() override = default;

    bool isMainThread() const override;
    void scheduleTimer(std::chrono::duration<double> delay, Task task) override;
    void post(Task task) override;
    /// Any thread.
    bool hasTasks();

private:
    void runTurn();
    bool runNextTask();
    bool mustGoOn();

    std::mutex lock_;
    std::deque<Task> tasks_;        ///< guarded by the lock
    bool isWakeupPending_ = false;  ///< guarded by the lock; a turn is certain to come

    QTimer nextTurn_;
    QObject receiver_;  ///< last: nothing is sent to a loop that is going
};

}  // namespace orvane::desktop
