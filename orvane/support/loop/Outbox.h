// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/RunLoop.h"

namespace orvane {

/// What one worker thread hands to the main thread, while somebody else decides when it is
/// delivered. A run loop asks for the calling thread's outbox in performOnMainThread, and puts
/// the task there when it has one.
class Outbox {
public:
    /// The calling thread's outbox; none for a thread that has none, as the main thread.
    static Outbox* ofThisThread();

    /// The worker's own thread. `UntilDone` returns when the task has run, or when it never will
    /// because the program ends.
    virtual void perform(contract::RunLoop::Task task, contract::RunLoop::Wait wait) = 0;

    /// Makes `outbox` the calling thread's for as long as this object lives.
    class Scope {
    public:
        explicit Scope(Outbox& outbox);
        Scope(const Scope&) = delete;
        Scope& operator=(const Scope&) = delete;
        ~Scope();

    private:
        Outbox* before_;
    };

protected:
    ~Outbox() = default;
};

}  // namespace orvane
