// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/host/foundation/RunLoop.h"

namespace orvane {

/// A front end's main loop. An implementation of performOnMainThread looks for the calling
/// thread's Outbox first, so that what workers hand over arrives in the workers' order.
class HostLoop : public fixwell::RunLoop {
public:
    /// Any thread. Queues the task behind what was posted before, past any outbox.
    virtual void post(Task task) = 0;
};

}  // namespace orvane
