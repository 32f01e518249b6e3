// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/RunLoop.h"
#include "pellar/jobs/JobLog.h"
#include "pellar/jobs/JobOptions.h"

#include <functional>
#include <memory>
#include <thread>

namespace pellar {

/// What every script uses. The references outlive it.
struct JobContext {
    const JobOptions& options;
    const Texts& texts;
    StopSwitch& stop;
    EventQueue& events;
    contract::DiskReference disk;
    JobLog log;
    RepairPolicy policy;

    JobContext(const contract::DiskReference& disk_, const JobOptions& options_,
               const Texts& texts_, StopSwitch& stop_, EventQueue& events_)
        : options(options_),
          texts(texts_),
          stop(stop_),
          events(events_),
          disk(disk_),
          log(disk, texts, events),
          policy(policyFor(options))
    {
    }

    /// Tells what the user can do next, where there is something to be told.
    void advise(const Trials::Advice& advice)
    {
        if (const std::string sentence = adviceFor(disk, advice); !sentence.empty())
            log.remark(sentence);
    }

    RepairWay repairWay() const { return repairWayFor(options, policy); }
};

/// Makes a script that heeds the switch and tells its events to the queue. Both outlive it.
using ScriptMaker = std::function<std::unique_ptr<Script>(StopSwitch&, EventQueue&)>;

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
    EventQueue events_;
    std::jthread thread_;
};

}  // namespace pellar
