// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/RunLoop.h"
#include "pellar/jobs/EventRoad.h"
#include "pellar/jobs/Script.h"
#include "pellar/process/Stopping.h"

#include <thread>

namespace pellar {

/// A job under way, on a thread of its own. Main thread. Destroying it ends the tool as fast as
/// is safe for the disk, waits until nothing of the job is left, and drops what it still had to
/// tell. The loop outlives it.
class Job {
public:
    Job(const ScriptMaker& makeScript, EventReceiver receiver, contract::RunLoop& loop);
    Job(const Job&) = delete;
    Job& operator=(const Job&) = delete;
    ~Job();

    /// Asks it to end; each further call presses harder.
    void stop() { stop_.press(); }

private:
    StopSwitch stop_;
    EventRoad road_;
    std::jthread thread_;
};

}  // namespace pellar
