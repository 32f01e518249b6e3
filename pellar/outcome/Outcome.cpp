// SPDX-License-Identifier: Apache-2.0
#include "pellar/outcome/Outcome.h"

#include "contract/pellar/ErrorCodes.h"

#include "contract/pellar/MessageKeys.h"

#include <algorithm>

namespace pellar {
namespace {

/// What was damaged before and is sound behind it was changed, whatever the tool says.
bool hasChanged(const RepairPass& pass)
{
    return pass.judgement.madeProgress || pass.replayedJournal || pass.foundProblems;
}

/// Nothing was wrong but that the journal's changes were not in their place.
bool onlyReplayedJournal(const std::vector<RepairPass>& passes)
{
    const bool replayed = std::any_of(passes.begin(), passes.end(),
                                      [](const RepairPass& pass) { return pass.replayedJournal; });
    const bool foundProblems = std::any_of(
        passes.begin(), passes.end(), [](const RepairPass& pass) { return pass.foundProblems; });
    return replayed && !foundProblems;
}

std::string_view messageKey(const Outcome& outcome, Operation operation)
{
    const bool isRepair = operation == Operation::Repair;
    const bool hasReason = !outcome.reason.isEmpty();
    switch (outcome.verdict) {
        case Verdict::Sound: return "verified “%1$@”: no damage was found";
        case Verdict::Repaired:
            return hasReason ? "repaired “%1$@”: %2$@" : "repaired “%1$@”: no damage is left";
        case Verdict::Stopped:
            return isRepair ? "stopped while repairing “%1$@”" : "stopped while verifying “%1$@”";
        case Verdict::Damaged:
            if (!isRepair)
                return hasReason ? "verified “%1$@”: damage was found; %2$@"
                                 : "verified “%1$@”: damage was found";
            return hasReason ? "cannot repair “%1$@”: %2$@"
                             : "cannot repair “%1$@”: damage is left";
        case Verdict::Inconclusive:
        case Verdict::Failed: break;
    }
    return isRepair ? "cannot repair “%1$@”: %2$@" : "cannot verify “%1$@”: %2$@";
}

}  // namespace

Outcome failedOutcome(contract::ErrorCode code, Sentence reason)
{
    return {Verdict::Failed, code, 0, std::move(reason), {}};
}

Outcome outcomeWithoutRepair(const Judgement& judgement)
{
    Outcome outcome = outcomeOfVerification(judgement);
    if (outcome.code == contract::kPLErrorDamaged)
        outcome.code = contract::kPLErrorDamagedForGood;
    return outcome;
}

Outcome outcomeOfVerification(const Judgement& judgement)
{
    return {judgement.verdict, judgement.code, judgement.detail, judgement.reason, {}};
}

bool isWorthAnotherPass(const std::vector<RepairPass>& passes, const Judgement& confirmation)
{
    return confirmation.verdict == Verdict::Damaged && !passes.empty() &&
           passes.size() < mostRepairPasses && passes.back().judgement.madeProgress;
}

std::vector<Sentence> lossesOf(const FileCounts& counts)
{
    std::vector<Sentence> losses;
    const bool areCounted = counts.before && counts.after;
    if (areCounted && *counts.after < *counts.before)
        losses.push_back(sentenceAbout(
            *counts.before - *counts.after, "no damage is left, but %1$@ of %2$@ files is gone",
            "no damage is left, but %1$@ of %2$@ files are gone", std::to_string(*counts.before)));
    if (counts.reconnected > 0)
        losses.push_back(
            sentenceAbout(counts.reconnected, counts.collectedOne, counts.collectedMany));
    if (counts.cleared > 0 && !areCounted)
        losses.push_back(sentenceAbout(
            counts.cleared,
            "no damage is left, but %1$@ file or name that made no sense had to be cleared",
            "no damage is left, but %1$@ files or names that made no sense had to be cleared"));
    return losses;
}

Outcome outcomeOfRepair(const std::vector<RepairPass>& passes, const Judgement& confirmation,
                        const FileCounts& counts)
{
    Outcome outcome = outcomeOfVerification(confirmation);
    if (confirmation.verdict == Verdict::Sound &&
        std::any_of(passes.begin(), passes.end(), hasChanged)) {
        outcome.verdict = Verdict::Repaired;
        if (onlyReplayedJournal(passes))
            outcome.reason = {"its journal was replayed; nothing else was wrong", {}, {}};
        outcome.warnings = lossesOf(counts);
        if (!outcome.warnings.empty())
            outcome.reason = outcome.warnings.front();
    } else if (confirmation.verdict == Verdict::Damaged) {
        outcome.code = outcome.code == contract::kPLErrorCutShort ? contract::kPLErrorCutShort
                                                                  : contract::kPLErrorNotRepaired;
        if (!passes.empty() && passes.back().judgement.verdict == Verdict::Failed)
            outcome.reason = passes.back().judgement.reason;
    }
    return outcome;
}

contract::Name nameOf(Verdict verdict)
{
    switch (verdict) {
        case Verdict::Sound: return contract::kPLVerdictSound;
        case Verdict::Damaged: return contract::kPLVerdictDamaged;
        case Verdict::Repaired: return contract::kPLVerdictRepaired;
        case Verdict::Inconclusive: return contract::kPLVerdictInconclusive;
        case Verdict::Failed: break;
        case Verdict::Stopped: return contract::kPLVerdictStopped;
    }
    return contract::kPLVerdictFailed;
}

std::string asLine(std::string message)
{
    if (!message.empty() && message.front() >= 'a' && message.front() <= 'z')
        message.front() = static_cast<char>(message.front() - 'a' + 'A');
    return message;
}

std::string messageOf(const Outcome& outcome, Operation operation, const std::string& diskName,
                      const Texts& texts)
{
    return Sentence{messageKey(outcome, operation), diskName, outcome.reason.in(texts)}.in(texts);
}

}  // namespace pellar
