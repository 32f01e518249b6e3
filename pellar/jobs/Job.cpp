// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/Job.h"

#include <memory>
#include <utility>

namespace pellar {

Job::Job(const ScriptMaker& makeScript, EventReceiver receiver, contract::RunLoop& loop)
    : events_(loop, std::move(receiver))
{
    auto script = makeScript(stop_, events_);
    thread_ = std::jthread([script = std::move(script)] { script->run(); });
}

// Closed first: the job's thread must not wait for a main loop that waits for the thread.
Job::~Job()
{
    events_.close();
    stop_.pressHard();
    thread_.join();
}

}  // namespace pellar
