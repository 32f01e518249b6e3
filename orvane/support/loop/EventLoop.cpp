// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/loop/EventLoop.h"

#include <utility>

namespace orvane {

contract::RunLoop::Task AwaitedTask::taskFor(const std::shared_ptr<AwaitedTask>& awaited,
                                             contract::RunLoop::Task task)
{
    // Given up when the last copy of the task is destroyed; harmless after it has run.
    const std::shared_ptr<AwaitedTask> ticket(awaited.get(),
                                              [awaited](AwaitedTask* it) { it->abandon(); });
    return [ticket, task = std::move(task)] {
        ticket->run(task);
    };
}

void AwaitedTask::run(const contract::RunLoop::Task& task)
{
    {
        const std::lock_guard guard(lock_);
        if (state_ != State::Pending)
            return;
        state_ = State::Running;
    }
    task();
    const std::lock_guard guard(lock_);
    state_ = State::Over;
    changed_.notify_all();
}

void AwaitedTask::wait()
{
    std::unique_lock guard(lock_);
    changed_.wait(guard, [this] { return state_ == State::Over; });
}

void AwaitedTask::abandon()
{
    const std::lock_guard guard(lock_);
    if (state_ == State::Pending) {
        state_ = State::Over;
        changed_.notify_all();
    }
}

namespace {

thread_local DeliveryQueue* current = nullptr;

}  // namespace

DeliveryQueue* DeliveryQueue::ofThisThread()
{
    return current;
}

DeliveryQueue::Scope::Scope(DeliveryQueue& queue) : before_(current)
{
    current = &queue;
}

DeliveryQueue::Scope::~Scope()
{
    current = before_;
}

void EventLoop::performOnMainThread(Task task, Wait wait)
{
    if (DeliveryQueue* const queue = DeliveryQueue::ofThisThread()) {
        queue->perform(std::move(task), wait);
    } else if (wait == Wait::No) {
        post(std::move(task));
    } else if (isMainThread()) {
        task();
    } else {
        const auto awaited = std::make_shared<AwaitedTask>();
        post(AwaitedTask::taskFor(awaited, std::move(task)));
        awaited->wait();
    }
}

}  // namespace orvane
