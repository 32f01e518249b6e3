// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/jobs/JobObserver.h"
#include "orvane/support/SupportHost.h"

#include <functional>

namespace orvane::desktop {

/// Keeps every run with its disk's history: when it began, and how it ended. Main thread.
class JobLedger final : public JobObserver {
public:
    struct Events {
        std::function<void()> began;
        std::function<void()> ended;  ///< the run is kept
    };

    /// The host outlives this object.
    JobLedger(SupportHost& host, Events events) : host_(host), events_(std::move(events)) {}

    /// A tool is at work. It is not while a job's images are being read.
    bool isJobRunning() const { return isJobRunning_; }

    void jobWillBegin(const fixwell::DiskReferencePointer& disk, Operation operation) override;
    void jobDidNotBegin(const fixwell::DiskReferencePointer& disk,
                        fixwell::ErrorCode error) override;
    void jobWillFinish(const fixwell::DiskReferencePointer& disk, fixwell::ErrorCode error,
                       const fixwell::Dictionary& result) override;

private:
    std::string keyOf(const fixwell::DiskReferencePointer& disk);
    void end(const RunEnd& end);

    SupportHost& host_;
    const Events events_;
    std::int64_t run_ = 0;  ///< the one that is under way; 0 when it could not be written
    bool isJobRunning_ = false;
};

}  // namespace orvane::desktop
