// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/host/foundation/RunLoop.h"
#include "pellar/ManagerOptions.h"
#include "pellar/Texts.h"
#include "pellar/jobs/EventRoad.h"
#include "pellar/jobs/JobScript.h"
#include "pellar/process/StopSwitch.h"

#include <thread>

namespace pellar {

/// A job under way, on a thread of its own. Main thread. Destroying it ends the tool as fast as
/// is safe for the disk, waits until nothing of the job is left, and drops what it still had to
/// tell. The references outlive it.
class Job {
public:
    Job(JobRequest request, EventReceiver receiver, fixwell::RunLoop& loop,
        const ManagerOptions& options, const Texts& texts);
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
