// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/OVDiskController.h"
#include "orvane/jobs/JobLedger.h"
#include "orvane/terminal/DiskNames.h"
#include "orvane/terminal/Reporter.h"
#include "orvane/terminal/TerminalWindow.h"

#include <functional>
#include <map>
#include <optional>
#include <string>

namespace orvane {

/// Follows the jobs of one run of the program: tells the reporter, and remembers the verdicts for
/// the exit status. Main thread only.
class JobReporter final {
public:
    struct Hooks {
        /// Writes the rows that are waiting.
        std::function<void()> flushRows;
        /// A job begins on this disk; its first row is the newest of the disk's log.
        std::function<void(const contract::DiskReferencePointer& disk)> follow;
    };

    /// All outlive this object.
    JobReporter(Reporter& reporter, const TerminalWindow& window, const DiskNames& names,
                Hooks hooks)
        : reporter_(reporter), window_(window), names_(names), hooks_(std::move(hooks))
    {
    }

    void began(const StartedRun& run, const contract::DiskReferencePointer& disk);
    void ended(const StartedRun& run, const RunEnd& end);

    /// Says that the last job has finished, once the module has added its last rows.
    void flush();
    /// What the user calls the disk whose rows are coming.
    void setCurrentDisk(const std::string& name) { current_ = name; }
    const std::string& currentDisk() const { return current_; }
    /// By disk identifier.
    const std::map<std::string, RunEnd>& outcomes() const { return outcomes_; }

private:
    Reporter& reporter_;
    const TerminalWindow& window_;
    const DiskNames& names_;
    Hooks hooks_;
    std::string current_;
    std::optional<RunEnd> unsaid_;
    std::map<std::string, RunEnd> outcomes_;
};

}  // namespace orvane
