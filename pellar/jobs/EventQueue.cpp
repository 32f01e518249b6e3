// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/EventQueue.h"

#include "contract/foundation/Array.h"
#include "contract/pellar/MessageKeys.h"
#include "pellar/jobs/JobObserver.h"

#include <condition_variable>
#include <mutex>
#include <utility>

namespace pellar {
namespace {

using namespace std::chrono_literals;

/// About what an event keeps in memory.
std::size_t bytesOf(const Event& event)
{
    constexpr std::size_t overhead = 64;
    const auto* const message = std::get_if<Message>(&event);
    if (message == nullptr)
        return overhead;
    const contract::Dictionary& dictionary = message->dictionary;
    return overhead + message->text.size() +
           (dictionary ? dictionary.string(contract::kFsckMessageString).size() : 0);
}

}  // namespace

/// Outlives the events in the tasks that wait in the main loop.
struct EventQueue::Shared {
    explicit Shared(EventReceiver r) : receiver(std::move(r)) {}

    std::mutex lock;
    std::condition_variable room;
    int underWay = 0;
    bool isClosed = false;   // written on the main thread only, so it may read without the lock
    EventReceiver receiver;  // main thread
};

/// One batch on its way; gives its place back when its task is done or dropped.
class EventQueue::Batch {
public:
    Batch(std::shared_ptr<Shared> shared, std::vector<Event> events)
        : shared_(std::move(shared)), events_(std::move(events))
    {
    }
    Batch(const Batch&) = delete;
    Batch& operator=(const Batch&) = delete;
    ~Batch()
    {
        const std::lock_guard guard(shared_->lock);
        --shared_->underWay;
        shared_->room.notify_one();
    }

    void arrive() { deliver(*shared_, events_); }

private:
    std::shared_ptr<Shared> shared_;
    std::vector<Event> events_;
};

EventQueue::EventQueue(contract::RunLoop& loop, EventReceiver receiver)
    : loop_(loop), shared_(std::make_shared<Shared>(std::move(receiver)))
{
}

void EventQueue::add(Event event)
{
    if (batch_.empty())
        oldest_ = Clock::now();
    bytes_ += bytesOf(event);
    batch_.push_back(std::move(event));
    if (batch_.size() >= batchEvents || bytes_ >= batchBytes)
        flush();
}

void EventQueue::flush()
{
    if (batch_.empty())
        return;
    bytes_ = 0;
    std::vector<Event> events = std::exchange(batch_, {});
    {
        std::unique_lock guard(shared_->lock);
        shared_->room.wait(
            guard, [this] { return shared_->isClosed || shared_->underWay < batchesUnderWay; });
        if (shared_->isClosed)
            return;
        ++shared_->underWay;
    }
    // Posted without the lock: a loop may run the task at once.
    const auto batch = std::make_shared<Batch>(shared_, std::move(events));
    loop_.performOnMainThread([batch] { batch->arrive(); }, contract::RunLoop::Wait::No);
}

void EventQueue::flushIfDue()
{
    if (!batch_.empty() && Clock::now() - oldest_ >= 100ms)
        flush();
}

void EventQueue::close()
{
    const std::lock_guard guard(shared_->lock);
    shared_->isClosed = true;
    shared_->room.notify_all();
}

void EventQueue::tellProgress(const EventReceiver& to, const contract::Dictionary& message)
{
    if (to.observer == nullptr ||
        message.string(contract::kFsckMessageType) != contract::kFsckProgress.text())
        return;
    const contract::Array parameters = message[contract::kFsckParameters].array();
    if (!parameters.isEmpty())
        to.observer->jobDidProgress(to.disk, parameters.front().real());
}

void EventQueue::deliver(Shared& shared, std::vector<Event>& events)
{
    for (const Event& event : events) {
        if (shared.isClosed)  // asked anew each time: the delegate may end the job
            return;
        const EventReceiver& to = shared.receiver;
        if (const auto* const message = std::get_if<Message>(&event)) {
            tellProgress(to, message->dictionary);
            to.delegate->plAsyncMessageForDisk(to.disk, message->text, message->dictionary);
        } else if (const auto* const trace = std::get_if<Trace>(&event)) {
            if (to.trace)
                to.trace(trace->line);
        } else if (const auto* const finished = std::get_if<Finished>(&event)) {
            to.ended();
            if (to.observer != nullptr)
                to.observer->jobWillFinish(to.disk, finished->mainError, finished->result);
            to.delegate->plAsyncFinishedForDisk(to.disk, finished->mainError, finished->detailError,
                                                finished->result);
            return;
        } else {
            to.delegate->plAsyncStartedForDisk(to.disk);
        }
    }
}

}  // namespace pellar
