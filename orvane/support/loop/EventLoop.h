// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/RunLoop.h"

#include <condition_variable>
#include <memory>
#include <mutex>

namespace orvane {

/// One task that one thread waits for while another runs it. Either side may go away first: an
/// abandoned task is never run, because what it refers to is gone with the waiting caller.
class AwaitedTask {
public:
    /// The task to hand over. Destroying it unrun abandons it.
    static contract::RunLoop::Task taskFor(const std::shared_ptr<AwaitedTask>& awaited,
                                           contract::RunLoop::Task task);

    /// Returns when the task has run or was abandoned.
    void wait();
    /// Wakes the waiting thread, unless the task is running: then its end does.
    void abandon();

private:
    enum class State { Pending, Running, Over };

    void run(const contract::RunLoop::Task& task);

    std::mutex lock_;
    std::condition_variable changed_;
    State state_ = State::Pending;
};

/// What one worker thread hands to the main thread, while its owner decides when it is
/// delivered. A run loop asks for the calling thread's queue in performOnMainThread, and puts
/// the task there when it has one.
class DeliveryQueue {
public:
    /// The calling thread's queue; none for a thread that has none, as the main thread.
    static DeliveryQueue* ofThisThread();

    /// The worker's own thread. `UntilDone` returns when the task has run, or when it never will
    /// because the program ends.
    virtual void perform(contract::RunLoop::Task task, contract::RunLoop::Wait wait) = 0;

    /// Makes `queue` the calling thread's for as long as this object lives.
    class Scope {
    public:
        explicit Scope(DeliveryQueue& queue);
        Scope(const Scope&) = delete;
        Scope& operator=(const Scope&) = delete;
        ~Scope();

    private:
        DeliveryQueue* before_;
    };

protected:
    ~DeliveryQueue() = default;
};

/// A front end's main loop. What a worker hands over goes through the calling thread's
/// DeliveryQueue, where it has one, so that it arrives in the workers' order.
class EventLoop : public contract::RunLoop {
public:
    void performOnMainThread(Task task, Wait wait) final;
    /// Any thread. Queues the task behind what was posted before, past any DeliveryQueue.
    virtual void post(Task task) = 0;
};

}  // namespace orvane
