// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/SupportHost.h"
#include "pellar/jobs/JobObserver.h"

#include <cstdint>
#include <filesystem>
#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace orvane {

/// One tool's run on one disk, as the user would name it.
struct StartedRun {
    pellar::Task task;
    std::string disk = {};        ///< any bytes
    std::string identifier = {};  ///< the disk's
    double percent = 0;           ///< how far it is, from 0 to 100
};

/// Keeps the runs of a manager's jobs with their disks' histories: when each began, and how it
/// ended. One run at a time. Main thread.
class JobLedger final : public pellar::JobObserver {
public:
    struct Events {
        std::function<void(const StartedRun&, const contract::DiskReferencePointer&)> began;
        std::function<void(const StartedRun&, const RunEnd&)> ended;  ///< the run is kept
        std::function<void()> stopAsked;                              ///< may be empty
        std::function<void(const StartedRun&)> progressed = {};       ///< may be empty
    };

    /// The host outlives this object.
    JobLedger(SupportHost& host, Events events) : host_(host), events_(std::move(events)) {}

    /// The run that is under way; null when none is. None is while a job's images are being read.
    const StartedRun* currentRun() const { return isRunning_ ? &run_ : nullptr; }

    /// The text of an error of the job at hand; where the disk is in use because its image is a
    /// device as well, that device is named.
    std::string withDevice(contract::ErrorCode error, std::string text) const;

private:
    void jobWillBegin(const contract::DiskReferencePointer& disk, pellar::Task task) override;
    void jobDidNotBegin(const contract::DiskReferencePointer& disk,
                        contract::ErrorCode error) override;
    void jobWillFinish(const contract::DiskReferencePointer& disk, contract::ErrorCode error,
                       const contract::Dictionary& result) override;
    void jobDidProgress(const contract::DiskReferencePointer& disk, double percent) override;
    void stopWasAsked() override;
    void end(const RunEnd& end);

    SupportHost& host_;
    const Events events_;
    StartedRun run_;
    bool isRunning_ = false;
    std::filesystem::path image_;  ///< that the last run was about; empty for a device
    std::int64_t number_ = 0;      ///< of the run that is under way; 0 when it was not written
};

/// What is known of a disk by its runs: a run that was stopped, or failed, says nothing about the
/// disk, and does not take the place of the last one that did. One that was undone does: what the
/// repair had come to is no longer true.
struct LastRuns {
    /// The last run that came to an answer; where none did, the last one.
    Run told;
    /// The last run, where it came to none and `told` did.
    std::optional<Run> later;
};

/// None when there was no run. Main thread.
[[nodiscard]] std::optional<LastRuns> lastRunsOf(HistoryStore& store, std::string_view key);
/// The same of what is known elsewhere as well: `other` is a run that another user keeps, or null.
[[nodiscard]] std::optional<LastRuns> lastRunsOf(HistoryStore& store, std::string_view key,
                                                 const Run* other);
/// The same of these runs, oldest first.
[[nodiscard]] std::optional<LastRuns> lastRunsIn(const std::vector<Run>& runs);

/// Keeps with an image, as a failed run and as a line of its log, that nothing of it could be
/// treated. A check that did not take place must not look like one that had nothing to say. Main
/// thread.
void keepUnreached(SupportHost& host, Disk& image, pellar::Operation operation,
                   const std::string& sentence);

}  // namespace orvane
