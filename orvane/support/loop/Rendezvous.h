// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/RunLoop.h"

#include <condition_variable>
#include <memory>
#include <mutex>

namespace orvane {

/// One task that one thread waits for while another runs it. Either side may go away first: an
/// abandoned task is never run, because what it refers to is gone with the waiting caller.
class Rendezvous {
public:
    /// The task to hand over. Destroying it unrun abandons the rendezvous.
    static contract::RunLoop::Task taskFor(const std::shared_ptr<Rendezvous>& rendezvous,
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

}  // namespace orvane
