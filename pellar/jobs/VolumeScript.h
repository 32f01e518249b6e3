// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/pellar/DiskReference.h"
#include "pellar/disks/WriteMark.h"
#include "pellar/jobs/Job.h"
#include "pellar/jobs/JobDisk.h"
#include "pellar/jobs/RepairPasses.h"
#include "pellar/jobs/VolumeRuns.h"
#include "pellar/outcome/Outcome.h"
#include "pellar/tools/Tool.h"

#include <filesystem>
#include <optional>
#include <vector>

namespace pellar {

struct VolumeRequest {
    contract::DiskReferencePointer disk;
    Operation operation = Operation::Verify;
    std::optional<DiskClaim> claim;  ///< none: the job claims the disk itself, unmounted before
    std::vector<Mount> mounts;       ///< where it is mounted, when there is no claim
    const Tool* tool = nullptr;      ///< null: the kind of the volume is still to be found out
};

/// What a job does, from the claimed disk to the verdict, on the thread that calls `run`:
///
///     Examining ─→ Verifying ─→ Deciding ─→ Done
///              └─→ Looking ─→ Trying ─→ Applying ─→ Done
///                         └─→ Repairing ─→ Done
///
/// Looking verifies before a repair. Trying repairs where the disk stays as it is, and what is
/// proven there is applied to it; Repairing lets the tool write to the disk itself. Deciding tries
/// a repair to know what a verification could not tell. A state goes to Done where it has decided.
///
/// A mounted disk is unmounted at the beginning and mounted again at the end. Whatever happens, it
/// tells *started* once, first, and *finished* once, last. The references outlive it.
class VolumeScript final : public Script {
public:
    VolumeScript(VolumeRequest request, JobContext context);

    void run() override;

private:
    enum class State { Examining, Verifying, Deciding, Looking, Repairing, Trying, Applying, Done };

    State next(State state);
    State examine();
    State verify();
    State decide();
    State look();
    State repair();
    State tryRepair();
    State apply();
    State end(Outcome outcome);

    std::optional<Outcome> objectionToJob() const;
    std::optional<Outcome> objection() const;
    std::optional<Outcome> objectionToDisk();
    std::optional<Outcome> objectionToSize();
    std::optional<Outcome> objectionToHistory();
    Outcome withoutTool() const;
    void tellJournal();
    void tellMeaning(const RunEvidence& evidence);
    std::optional<Sentence> beginTrial();
    Outcome decidedBy(const Outcome& tried, bool foundProblems);

    const Operation operation_;
    const Tool* tool_;
    JobContext context_;
    JobLog& log_ = context_.log;
    JobDisk disk_;
    VolumeRuns runs_{disk_, context_};

    RepairPasses::Look look_;
    std::optional<TrialDisk> trial_;
    WriteMark mark_;  ///< of the disk before the trial
    Outcome outcome_;
};

}  // namespace pellar
