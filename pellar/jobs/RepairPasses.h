// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/jobs/VolumeRuns.h"
#include "pellar/outcome/Outcome.h"

#include <vector>

namespace pellar {

/// The repairing runs of a job, each with the verification behind it, as long as damage is left
/// and the last got somewhere:
///
///     Replaying ─→ Confirming ⇄ Repairing
///
/// The job's thread; the references outlive it.
class RepairPasses {
public:
    /// What the verification before them has shown.
    struct Look {
        bool foundDamage = false;    ///< and has shown it
        bool waitsForMount = false;  ///< a log is brought to its place first, by the kernel
        FileCounts counts;           ///< of the files
    };

    /// The share of the job's progress that they take, in per cent.
    struct Share {
        double from = 0;
        double to = 100;
    };

    RepairPasses(VolumeRuns& runs, JobContext& context, Look look, Share share);

    [[nodiscard]] Outcome run();

    /// Of the last `run`: something was found that no replaying of a journal explains.
    bool foundProblems() const;
    const FileCounts& counts() const { return look_.counts; }

private:
    std::optional<Outcome> replay();
    std::optional<Outcome> repair();
    Judgement confirm();

    VolumeRuns& runs_;
    JobContext& context_;
    JobLog& log_ = context_.log;
    Look look_;
    const Share share_;
    std::vector<RepairPass> passes_;
    bool leftDamage_ = false;  ///< a pass, by the verification behind it
};

}  // namespace pellar
