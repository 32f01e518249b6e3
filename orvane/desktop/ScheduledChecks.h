// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/jobs/PublishedChecks.h"
#include "orvane/support/loop/EventLoop.h"
#include "orvane/support/systemd/CheckTimers.h"

#include <QFileSystemWatcher>
#include <QTimer>

#include <filesystem>
#include <functional>
#include <memory>
#include <thread>
#include <vector>

namespace orvane::desktop {

/// What the machine's scheduled checks have found, and when they are due next. The service manager
/// is asked in a thread of its own. Main thread.
class ScheduledChecks {
public:
    /// `changed` is called from the loop, which outlives this object, when there is something else
    /// to be known.
    ScheduledChecks(EventLoop& loop, std::function<void()> changed,
                    std::filesystem::path directory = systemChecks);
    ScheduledChecks(const ScheduledChecks&) = delete;
    ScheduledChecks& operator=(const ScheduledChecks&) = delete;
    /// Does not wait for an answer that is awaited.
    ~ScheduledChecks() { *liveness_ = nullptr; }

    /// Reads, asks and watches from now on. Nothing is known before.
    void start();

    /// The last one that came to something; null where there was none. Valid until `changed`.
    [[nodiscard]] const Run* lastRun(std::string_view key) const
    {
        return publishedRun(published_, key);
    }
    [[nodiscard]] std::optional<std::chrono::system_clock::time_point> nextOf(
        const Disk& disk) const
    {
        return nextCheckOf(disk, timers_);
    }

private:
    void look();
    void askForTimers();

    EventLoop& loop_;
    const std::function<void()> changed_;
    const std::filesystem::path directory_;
    PublishedChecks published_;
    std::vector<CheckTimer> timers_;
    QFileSystemWatcher files_;
    QTimer moment_;  ///< several changes are looked at once
    QTimer clock_;
    /// Handed to the task that reports back, which finds it empty when this object has gone.
    std::shared_ptr<ScheduledChecks*> liveness_ = std::make_shared<ScheduledChecks*>(this);
    std::jthread thread_;
};

}  // namespace orvane::desktop
