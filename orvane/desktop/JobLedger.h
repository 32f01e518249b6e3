// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/session/FinishedRun.h"
#include "orvane/jobs/JobObserver.h"
#include "orvane/jobs/RunKeeper.h"

#include <functional>

namespace orvane::desktop {

/// Keeps every run with its disk's history: when it began, and how it ended. Main thread.
class JobLedger final : public JobObserver {
public:
    struct Events {
        std::function<void(const StartedRun&)> began;
        std::function<void(const StartedRun&, const RunEnd&)> ended;  ///< the run is kept
        std::function<void()> stopAsked;
    };

    /// The host outlives this object.
    JobLedger(SupportHost& host, Events events) : runs_(host), events_(std::move(events)) {}

    /// A tool is at work. It is not while a job's images are being read.
    bool isJobRunning() const { return isJobRunning_; }
    /// The run that is under way; none when none is.
    const StartedRun* currentRun() const { return isJobRunning_ ? &run_ : nullptr; }
    const RunKeeper& runs() const { return runs_; }

    void jobWillBegin(const contract::DiskReferencePointer& disk, Operation operation) override;
    void jobDidNotBegin(const contract::DiskReferencePointer& disk,
                        contract::ErrorCode error) override;
    void jobWillFinish(const contract::DiskReferencePointer& disk, contract::ErrorCode error,
                       const contract::Dictionary& result) override;
    void stopWasAsked() override { events_.stopAsked(); }

private:
    void end(const RunEnd& end);

    RunKeeper runs_;
    const Events events_;
    StartedRun run_;
    bool isJobRunning_ = false;
};

}  // namespace orvane::desktop
