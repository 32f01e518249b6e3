// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/pellar/DiskReference.h"
#include "pellar/jobs/Job.h"
#include "pellar/jobs/JobDisk.h"
#include "pellar/jobs/ToolRun.h"
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
///     Examining ─→ Verifying ─→ Done
///              └─→ Looking ─→ Repairing ⇄ Confirming ─→ Done
///                         ├─→ Replaying ─→ Confirming
///                         └─→ Done
///
/// Looking verifies before a repair; Replaying brings a log to its place by mounting.
///
/// A mounted disk is unmounted at the beginning and mounted again at the end. Whatever happens, it
/// tells *started* once, first, and *finished* once, last. The references outlive it.
class VolumeScript final : public Script {
public:
    VolumeScript(VolumeRequest request, JobContext context);

    void run() override;

private:
    enum class State { Examining, Verifying, Looking, Replaying, Repairing, Confirming, Done };

    State next(State state);
    State examine();
    State verify();
    State look();
    State replay();
    State repair();
    State confirm();
    State end(Outcome outcome);

    std::optional<Outcome> objectionToJob() const;
    std::optional<Outcome> objection() const;
    std::optional<Outcome> objectionToDisk();
    std::optional<Outcome> objectionToSize();
    VolumeFacts factsFor(const Tool& tool) const;
    Outcome withoutTool() const;
    void tellMeaning(const RunEvidence& evidence);
    RunEvidence runOnce(Access access, ToolRun::Problems problems);
    Judgement judge(const RunEvidence& evidence) const;
    Judgement asKernelSays(const Judgement& judgement, const RunEvidence& evidence) const;
    std::optional<std::uint64_t> unreadableByte(const ReadFault& fault) const;
    std::optional<std::uint64_t> firstUnreadable(const std::vector<DiskPiece>& pieces) const;

    const Operation operation_;
    const Tool* tool_;
    JobContext context_;
    JobLog& log_ = context_.log;
    JobDisk disk_;

    std::filesystem::path program_;
    std::filesystem::path repairProgram_;
    VolumeFacts volume_;
    std::optional<Judgement> obstacle_;  ///< why the last run could not even be prepared
    std::vector<RepairPass> passes_;
    bool foundDamage_ = false;  ///< the verification before the repair did
    FileCounts counts_;
    Outcome outcome_;
};

}  // namespace pellar
