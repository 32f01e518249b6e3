// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/DiskPane.h"
#include "orvane/desktop/ModuleTabs.h"
#include "orvane/desktop/WindowCloser.h"
#include "orvane/desktop/session/DesktopNotifier.h"
#include "orvane/desktop/session/SleepInhibitor.h"
#include "orvane/desktop/session/TaskBarProgress.h"

#include <chrono>
#include <functional>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <vector>

namespace orvane::desktop {

/// What a job means beyond its tab: for the list, the disks it works on, and the user's session. A
/// job is all that is done while the window is locked, be it on one disk or on many. Main thread.
class JobWatch {
public:
    /// The disks and the closer outlive this object. The desktop is told of the end of a job that
    /// took longer than `glance`. `updated` is called when the window has been brought up to date
    /// after a job.
    JobWatch(const SessionParts& parts, DiskPane& disks, WindowCloser& closer,
             const SessionBuses& buses, std::chrono::milliseconds glance,
             std::function<void()> updated);
    JobWatch(const JobWatch&) = delete;
    JobWatch& operator=(const JobWatch&) = delete;

    /// The window was locked for a job, or is free again.
    void lockChanged(bool isLocked);
    /// The module's own report at the end of its job.
    void reported(const contract::Dictionary& report);

    /// Whether what the job at hand has come to stands with its disks, and not with another that
    /// has taken the place of one.
    bool hasResult() const;

    // As the ledger hears it.

    void runBegan(const StartedRun& run);
    void runProgressed(const StartedRun& run);
    void runEnded(const StartedRun& run, const RunEnd& end);
    void stopAsked();

    /// What the status line says of the run that is under way: what is done to which disk, which of
    /// several it is, and how far; without a run, the module's own words.
    std::string statusText(std::string_view moduleText);

private:
    void begin();
    void end();
    void showProgress(std::optional<double> percent);
    std::string placeOf(const StartedRun& run);
    void lookBack();
    std::vector<std::string> keepUnreachedImages();
    std::string text(std::string_view key) { return at_.host.translator().text(key); }

    /// The job that runs, or ran last.
    struct Job {
        std::string action = {};                        ///< the selector that began it
        std::vector<std::shared_ptr<Disk>> disks = {};  ///< that it was to work on
        std::chrono::steady_clock::time_point start = std::chrono::steady_clock::now();
        std::unique_ptr<contract::OVTimeEstimator> estimator = {};  ///< of the run under way
        std::set<std::string> reached = {};  ///< identifiers of disks that a run was about
        std::vector<FinishedRun> runs = {};
        bool isStopAsked = false;
        bool hasFailed = false;  ///< by the module's own report
        bool isCheck = true;     ///< else a module does something of its own
    };

    const SessionParts at_;
    DiskPane& disks_;
    WindowCloser& closer_;
    const std::chrono::milliseconds longestGlanceAway_;
    const std::function<void()> updated_;
    SleepInhibitor wakefulness_;
    DesktopNotifier notifier_;
    TaskBarProgress taskBar_;
    Job job_;
};

}  // namespace orvane::desktop
