// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/loop/Rendezvous.h"

#include <utility>

namespace orvane {
namespace {

/// Abandons when the last copy of the task is destroyed; harmless after the task has run.
struct Ticket {
    explicit Ticket(std::shared_ptr<Rendezvous> r) : rendezvous(std::move(r)) {}
    Ticket(const Ticket&) = delete;
    Ticket& operator=(const Ticket&) = delete;
    ~Ticket() { rendezvous->abandon(); }

    std::shared_ptr<Rendezvous> rendezvous;
};

}  // namespace

contract::RunLoop::Task Rendezvous::taskFor(const std::shared_ptr<Rendezvous>& rendezvous,
                                           contract::RunLoop::Task task)
{
    return [ticket = std::make_shared<Ticket>(rendezvous), task = std::move(task)] {
        ticket->rendezvous->run(task);
    };
}

void Rendezvous::run(const contract::RunLoop::Task& task)
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

void Rendezvous::wait()
{
    std::unique_lock guard(lock_);
    changed_.wait(guard, [this] { return state_ == State::Over; });
}

void Rendezvous::abandon()
{
    const std::lock_guard guard(lock_);
    if (state_ == State::Pending) {
        state_ = State::Over;
        changed_.notify_all();
    }
}

}  // namespace orvane
