// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/OVDiskController.h"
#include "orvane/jobs/JobObserver.h"
#include "orvane/jobs/RunKeeper.h"
#include "orvane/terminal/DiskNames.h"
#include "orvane/terminal/Reporter.h"
#include "orvane/terminal/TerminalWindow.h"

#include <functional>
#include <map>
#include <optional>
#include <string>

namespace orvane {

/// Follows the jobs of one run of the program: tells the reporter, remembers the verdicts for the
/// exit status, and has them kept with the disks' histories. Main thread only.
class JobReporter final : public JobObserver {
public:
    struct Hooks {
        /// Writes the rows that are waiting.
        std::function<void()> flushRows;
        /// A job begins on this disk; its first row is the newest of the disk's log.
        std::function<void(const contract::DiskReferencePointer& disk)> follow;
    };

    /// All outlive this object.
    JobReporter(Reporter& reporter, const TerminalWindow& window, const DiskNames& names,
                SupportHost& host, Hooks hooks)
        : reporter_(reporter), window_(window), names_(names), runs_(host), hooks_(std::move(hooks))
    {
    }

    void jobWillBegin(const contract::DiskReferencePointer& disk, Operation operation) override;
    void jobDidNotBegin(const contract::DiskReferencePointer& disk,
                        contract::ErrorCode error) override;
    void jobWillFinish(const contract::DiskReferencePointer& disk, contract::ErrorCode error,
                       const contract::Dictionary& result) override;

    /// Says that the last job has finished, once the module has added its last rows.
    void flush();
    /// What the user calls the disk whose rows are coming.
    void setCurrentDisk(const std::string& name) { current_ = name; }
    const std::string& currentDisk() const { return current_; }
    /// Between a job's beginning and its end.
    bool isInFlight() const { return isInFlight_; }
    const RunKeeper& runs() const { return runs_; }
    /// By disk identifier.
    const std::map<std::string, RunEnd>& outcomes() const { return outcomes_; }

private:
    void settle(const std::string& identifier, RunEnd outcome);

    Reporter& reporter_;
    const TerminalWindow& window_;
    const DiskNames& names_;
    RunKeeper runs_;
    Hooks hooks_;
    std::string current_;
    bool isInFlight_ = false;
    std::optional<RunEnd> unsaid_;
    std::map<std::string, RunEnd> outcomes_;
};

}  // namespace orvane
