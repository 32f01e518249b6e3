// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/RepairPasses.h"

#include "contract/pellar/ErrorCodes.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <iterator>
#include <utility>

namespace pellar {
namespace {

Outcome notReplayed(int error)
{
    const Sentence reason =
        error == EPERM || error == EACCES
            ? Sentence{"its log has to be replayed by mounting it, which only an administrator may",
                       {},
                       {}}
            : Sentence{"its log could not be replayed by mounting it: %1$@",
                       ::strerrordesc_np(error),
                       {}};
    return {Verdict::Inconclusive, contract::kPLErrorInconclusive, error, reason};
}

/// The disk went away, or the user did not want more: nothing is left to be confirmed.
bool isOver(const Judgement& judgement)
{
    return judgement.verdict == Verdict::Stopped ||
           judgement.code == contract::kPLErrorUnreadable ||
           judgement.code == contract::kPLErrorDiskChanged ||
           judgement.code == contract::kPLErrorDiskInUse;
}

}  // namespace

RepairPasses::RepairPasses(VolumeRuns& runs, JobContext& context, Look look, Share share)
    : runs_(runs), context_(context), look_(std::move(look)), share_(share)
{
}

Outcome RepairPasses::run()
{
    if (auto over = look_.waitsForMount ? replay() : repair())
        return *std::move(over);
    Judgement confirmation = confirm();
    while (isWorthAnotherPass(passes_, confirmation)) {
        if (auto over = repair())
            return *std::move(over);
        confirmation = confirm();
    }
    Outcome outcome = outcomeOfRepair(passes_, confirmation, look_.counts);
    // The verification behind it decides, but a repair that was cut off is not kept quiet about.
    if (outcome.verdict == Verdict::Sound || outcome.verdict == Verdict::Repaired)
        for (const RepairPass& pass : passes_)
            if (pass.judgement.verdict == Verdict::Failed)
                log_.failure(pass.judgement.reason);
    return outcome;
}

std::optional<Outcome> RepairPasses::replay()
{
    log_.step(Operation::Repair, {"Replaying the log by mounting the volume", {}, {}});
    if (const int error = runs_.replayLog())
        return notReplayed(error);
    passes_.push_back({{Verdict::Inconclusive, contract::kPLErrorInconclusive, 0, {}, true}, true});
    return std::nullopt;
}

/// The share of the passes that a repair takes; the verification behind it takes the rest.
constexpr double repairShare = 0.6;

std::optional<Outcome> RepairPasses::repair()
{
    const double whole = share_.to - share_.from;
    log_.meter().setRange(share_.from, share_.from + whole * repairShare);
    const RunEvidence evidence = runs_.run(
        Access::ReadWrite, look_.foundDamage ? ToolRun::Problems::Kept : ToolRun::Problems::Shown);
    const Judgement judgement = runs_.judge(evidence);
    passes_.push_back({judgement, evidence.findings.replayedJournal,
                       evidence.findings.problems > 0 || look_.foundDamage});
    look_.counts.reconnected += evidence.findings.reconnected;
    look_.counts.cleared += evidence.findings.cleared;
    std::ranges::copy(evidence.findings.changes, std::back_inserter(look_.counts.changes));
    return isOver(judgement) ? std::optional(outcomeOfVerification(judgement)) : std::nullopt;
}

Judgement RepairPasses::confirm()
{
    const double whole = share_.to - share_.from;
    log_.meter().setRange(share_.from + whole * repairShare, share_.to);
    const RunEvidence evidence = runs_.run(Access::ReadOnly, ToolRun::Problems::Shown);
    look_.counts.after = evidence.findings.files;
    Judgement judgement = runs_.judgeWithLog(evidence);
    leftDamage_ = leftDamage_ || judgement.verdict == Verdict::Damaged;
    return judgement;
}

bool RepairPasses::foundProblems() const
{
    return leftDamage_ || std::any_of(passes_.begin(), passes_.end(),
                                      [](const RepairPass& pass) { return pass.foundProblems; });
}

}  // namespace pellar
