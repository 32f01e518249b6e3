// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/loop/WorkerThreads.h"

#include "orvane/support/loop/EventLoop.h"

#include <algorithm>
#include <system_error>
#include <thread>
#include <utility>
#include <vector>

namespace orvane {

class WorkerThreads::Worker final : public DeliveryQueue {
public:
    explicit Worker(WorkerThreads& o) : owner(o) {}

    void perform(contract::RunLoop::Task task, contract::RunLoop::Wait wait) override
    {
        if (wait == contract::RunLoop::Wait::No) {
            owner.perform(*this, std::move(task));
            return;
        }
        const auto mine = std::make_shared<AwaitedTask>();
        {
            const std::lock_guard guard(owner.lock_);
            awaited = mine;
        }
        owner.perform(*this, AwaitedTask::taskFor(mine, std::move(task)));
        mine->wait();
    }

    void run(const contract::RunLoop::Task& task)
    {
        {
            const Scope scope(*this);
            task();
        }
        owner.hasEnded(*this);
    }

    WorkerThreads& owner;
    std::thread thread;
    // All guarded by the owner's lock.
    std::vector<contract::RunLoop::Task> heldBack;
    std::shared_ptr<AwaitedTask> awaited;  ///< the one it waited at last
    bool isFirst = false;                  ///< nothing needs to be held back
    bool isOver = false;
};

WorkerThreads::WorkerThreads(EventLoop& loop) : loop_(loop) {}

WorkerThreads::~WorkerThreads()
{
    {
        const std::lock_guard guard(lock_);
        isClosing_ = true;
        for (const auto& worker : workers_)
            if (worker->awaited)
                worker->awaited->abandon();
    }
    closing_.notify_all();
    for (const auto& worker : workers_)
        if (worker->thread.joinable())
            worker->thread.join();
}

void WorkerThreads::detachNewThread(contract::RunLoop::Task task)
{
    joinEnded();
    Worker* worker = nullptr;
    {
        const std::lock_guard guard(lock_);
        const bool isFirst = std::all_of(workers_.begin(), workers_.end(),
                                         [](const auto& other) { return other->isOver; });
        worker = workers_.emplace_back(std::make_unique<Worker>(*this)).get();
        worker->isFirst = isFirst;
    }
    try {
        worker->thread = std::thread([worker, task] { worker->run(task); });
    } catch (const std::system_error&) {
        worker->run(task);
    }
}

void WorkerThreads::perform(Worker& worker, contract::RunLoop::Task task)
{
    const std::lock_guard guard(lock_);
    if (isClosing_) {
        if (worker.awaited)
            worker.awaited->abandon();
    } else if (worker.isFirst) {
        loop_.post(std::move(task));
    } else {
        worker.heldBack.push_back(std::move(task));
    }
}

void WorkerThreads::hasEnded(Worker& worker)
{
    const std::lock_guard guard(lock_);
    worker.isOver = true;
    if (!worker.isFirst)
        return;
    for (const auto& next : workers_) {
        if (next->isOver && next->isFirst)
            continue;
        passOnFrom(*next);
        if (!next->isOver)
            return;
    }
}

void WorkerThreads::passOnFrom(Worker& worker)
{
    worker.isFirst = true;
    for (contract::RunLoop::Task& task : worker.heldBack)
        if (!isClosing_)
            loop_.post(std::move(task));
    worker.heldBack.clear();
}

// An ended worker has only its thread's last instructions to go, so joining does not wait.
void WorkerThreads::joinEnded()
{
    std::list<std::unique_ptr<Worker>> ended;
    {
        const std::lock_guard guard(lock_);
        for (auto worker = workers_.begin(); worker != workers_.end();) {
            const auto next = std::next(worker);
            if ((*worker)->isOver && (*worker)->isFirst)
                ended.splice(ended.end(), workers_, worker);
            worker = next;
        }
    }
    for (const auto& worker : ended)
        if (worker->thread.joinable())
            worker->thread.join();
}

void WorkerThreads::sleepUntil(Date date)
{
    std::unique_lock guard(lock_);
    if (!attachesSynchronously_)
        closing_.wait_until(guard, date, [this] { return isClosing_ || attachesSynchronously_; });
}

void WorkerThreads::setAttachesSynchronously(bool isSynchronous)
{
    const std::lock_guard guard(lock_);
    attachesSynchronously_ = isSynchronous;
    closing_.notify_all();
}

}  // namespace orvane
