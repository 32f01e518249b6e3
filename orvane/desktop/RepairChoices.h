// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/DiskPane.h"
#include "orvane/desktop/ModuleTabs.h"
#include "orvane/desktop/window/Question.h"
#include "pellar/jobs/JobOptions.h"

#include <functional>
#include <memory>
#include <string>
#include <string_view>

namespace orvane::desktop {

/// What the user can choose about a repair beyond the module's button: to hear first what will be
/// written, to see what it would do, and, where it came to nothing, what to do instead. Main
/// thread.
class RepairChoices {
public:
    /// All outlive this object. `policy` is what the library asks for as a job begins: other than
    /// it was only for the length of a job that is begun here. `explainCopying` says how a disk
    /// that cannot be read is copied.
    RepairChoices(const SessionParts& parts, DiskPane& disks, const KeptRepairs& kept,
                  pellar::RepairPolicy& policy, std::function<void()> explainCopying)
        : at_(parts),
          disks_(disks),
          kept_(kept),
          policy_(policy),
          explainCopying_(std::move(explainCopying))
    {
    }
    RepairChoices(const RepairChoices&) = delete;
    RepairChoices& operator=(const RepairChoices&) = delete;

    /// Whether the module may perform what its button asks for; where NO, the user is asked, and
    /// may have it done.
    [[nodiscard]] bool mayPerform(std::string_view action);

    /// Why no repair of what is selected can be previewed, in the user's language; empty when one
    /// can.
    std::string reasonAgainstPreview();
    void preview() { begin(&pellar::RepairPolicy::isPreview); }

    // Of the one disk that is selected, after a repair that came to nothing: asks once more.

    void confirmUnproven();
    void confirmDirect();

    /// The window was locked for a job, or is free again.
    void lockChanged(bool isLocked);

private:
    using Way = bool pellar::RepairPolicy::*;

    void begin(Way way);
    void press(std::string_view button);
    std::string meaningOfRepair(std::string_view action);
    std::string nameOfSelection();
    bool isUnreadable();
    void askBeforeRepair(std::string_view action);
    void confirm(const char* objectName, std::string_view question, std::string_view meaning,
                 std::string_view answer, Way way);
    void repair(const Disk& disk, Way way);
    std::string text(std::string_view key) const { return at_.host.translator().text(key); }
    std::string sentence(std::string_view key, const std::string& name) const
    {
        return at_.host.translator().sentence(key, {name});
    }

    const SessionParts at_;
    DiskPane& disks_;
    const KeptRepairs& kept_;
    pellar::RepairPolicy& policy_;
    const std::function<void()> explainCopying_;
    bool isConfirmed_ = false;  ///< the press at hand
};

}  // namespace orvane::desktop
