// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/DiskPane.h"
#include "orvane/desktop/KeptRepairs.h"
#include "orvane/desktop/ModuleTabs.h"
#include "orvane/desktop/window/Question.h"
#include "orvane/jobs/HostJob.h"

#include <functional>
#include <memory>
#include <string>

namespace orvane::desktop {

/// How the user takes the repair of a disk back, or finishes one that was interrupted: it is asked
/// for, done as a job of the host's own while the window is locked, and told in the disk's log.
/// Main thread.
class RepairUndoing {
public:
    enum class Scope { Disk, Permissions };

    /// The disks, the kept repairs and the texts outlive this object. The ledger is the options'
    /// observer. `update` shows that the window is locked.
    RepairUndoing(const SessionParts& parts, const DiskPane& disks, KeptRepairs& kept,
                  const pellar::Texts& texts, const pellar::JobOptions& options,
                  std::function<void()> update);
    RepairUndoing(const RepairUndoing&) = delete;
    RepairUndoing& operator=(const RepairUndoing&) = delete;

    // Of the disk that is selected: of what it holds, which is a file system or a map, or of its
    // files' permissions; `operation` is Undo or Finish.

    /// Why it cannot be done, in the user's language; empty when it can. Looks at what is kept.
    std::string reasonAgainst(pellar::Operation operation, Scope scope = Scope::Disk);
    /// Tells what it means, and does it if the user wants that; or tells why it cannot be done.
    void ask(pellar::Operation operation, Scope scope = Scope::Disk);

    /// As the ledger hears it, of any job.
    void runEnded(const StartedRun& run, const RunEnd& end);

private:
    std::shared_ptr<Disk> disk(Scope scope) const;
    Question questionAbout(pellar::Task task, const std::shared_ptr<Disk>& disk);
    std::string meaningOf(pellar::Task task, const pellar::ListedRecord* record);
    void begin(pellar::Task task, const std::shared_ptr<Disk>& disk);
    void showProgress(const std::string& title);
    void finish(const std::string& title, const RunEnd& end);
    std::string text(std::string_view key) { return at_.host.translator().text(key); }

    const SessionParts at_;
    const DiskPane& disks_;
    KeptRepairs& kept_;
    const std::function<void()> update_;
    pellar::Manager library_;
    std::string title_;  ///< of the job
    std::unique_ptr<HostJob> job_;
};

}  // namespace orvane::desktop
