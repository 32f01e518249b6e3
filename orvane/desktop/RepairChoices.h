// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/DiskPane.h"
#include "orvane/desktop/ModuleTabs.h"
#include "orvane/desktop/RepairUndoing.h"
#include "orvane/desktop/WindowCloser.h"
#include "orvane/desktop/window/Question.h"
#include "pellar/jobs/JobOptions.h"

#include <cstddef>
#include <deque>
#include <memory>
#include <string>
#include <string_view>

namespace orvane::desktop {

/// What the user can choose about a repair beyond the module's button: to see what it would do,
/// and, where it came to nothing, what to do instead. Main thread.
class RepairChoices {
public:
    /// All outlive this object. `policy` is what the library asks for as a job begins: other than
    /// it was only for the length of a job that is begun here.
    RepairChoices(const SessionParts& parts, DiskPane& disks, const KeptRepairs& kept,
                  RepairUndoing& undoing, const WindowCloser& closer, pellar::RepairPolicy& policy)
        : at_(parts),
          disks_(disks),
          kept_(kept),
          undoing_(undoing),
          closer_(closer),
          policy_(policy)
    {
    }
    RepairChoices(const RepairChoices&) = delete;
    RepairChoices& operator=(const RepairChoices&) = delete;

    /// Why no repair of what is selected can be previewed, in the user's language; empty when one
    /// can.
    std::string reasonAgainstPreview();
    void preview() { begin(&pellar::RepairPolicy::isPreview); }

    /// The window was locked for a job, or is free again.
    void lockChanged(bool isLocked);
    /// As the ledger hears it.
    void runEnded(const StartedRun& run, const RunEnd& end);
    /// Whether what the module would say about the job at hand is said by `offer`.
    bool saysMoreThanModule() const { return runsInJob_ == 1 && offers_.size() == 1; }
    /// After a job: asks, for one disk after the other, what to do about a repair that came to
    /// nothing.
    void offer();

private:
    struct Offer {
        std::shared_ptr<Disk> disk;
        contract::ErrorCode error;
        std::string message;  ///< of the run
    };

    using Way = bool pellar::RepairPolicy::*;

    void begin(Way way);
    Question questionAbout(const Offer& offer);
    void confirmUnproven(const Offer& offer);
    void confirmDirect(const Offer& offer);
    void repair(const Disk& disk, Way way);
    void undo(const Disk& disk, pellar::Operation operation);
    std::string text(std::string_view key) const { return at_.host.translator().text(key); }
    std::string sentence(std::string_view key, const Disk& disk) const
    {
        return at_.host.translator().sentence(key, {disk.displayName()});
    }

    const SessionParts at_;
    DiskPane& disks_;
    const KeptRepairs& kept_;
    RepairUndoing& undoing_;
    const WindowCloser& closer_;
    pellar::RepairPolicy& policy_;
    std::size_t runsInJob_ = 0;
    std::deque<Offer> offers_;
};

}  // namespace orvane::desktop
