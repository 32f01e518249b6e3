// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/loop/EventLoop.h"

#include <condition_variable>
#include <list>
#include <memory>
#include <mutex>

namespace orvane {

/// Short-lived worker threads, one for each task. What a worker performs on the main thread is
/// held back until every worker that was detached before it has ended, so the main thread hears
/// from the workers in the order in which they were detached.
///
/// Destroying this object (on the main thread, before the loop) waits for the workers; what they
/// still hand over is dropped, and a worker that sleeps or waits for the main thread is woken.
class WorkerThreads final : public contract::Threads {
public:
    explicit WorkerThreads(EventLoop& loop);
    WorkerThreads(const WorkerThreads&) = delete;
    WorkerThreads& operator=(const WorkerThreads&) = delete;
    ~WorkerThreads() override;

    /// Where the system gives no more threads, the task runs before this returns.
    void detachNewThread(contract::RunLoop::Task task) override;
    /// Returns at once when the host attaches disk images synchronously: every disk of the image
    /// is there when the attachment has returned.
    void sleepUntil(Date date) override;
    Date now() const override { return std::chrono::system_clock::now(); }

    void setAttachesSynchronously(bool isSynchronous);

private:
    class Worker;

    void perform(Worker& worker, contract::RunLoop::Task task);
    void hasEnded(Worker& worker);
    void passOnFrom(Worker& worker);
    void joinEnded();

    EventLoop& loop_;
    std::mutex lock_;
    std::condition_variable closing_;
    bool isClosing_ = false;             ///< guarded by the lock
    bool attachesSynchronously_ = true;  ///< guarded by the lock
    /// In the order of detaching; the first that has not ended delivers directly. Guarded by the
    /// lock, as is what the workers hold back.
    std::list<std::unique_ptr<Worker>> workers_;
};

}  // namespace orvane
