// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/RunLoop.h"

namespace orvane {

/// A front end's main loop. What a worker hands over goes through the calling thread's Outbox,
/// where it has one, so that it arrives in the workers' order.
class HostLoop : public contract::RunLoop {
public:
    void performOnMainThread(Task task, Wait wait) final;
    /// Any thread. Queues the task behind what was posted before, past any outbox.
    virtual void post(Task task) = 0;
};

}  // namespace orvane
