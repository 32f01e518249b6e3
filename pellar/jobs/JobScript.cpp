// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/JobScript.h"

#include "fixwell/host/foundation/UTF8.h"
#include "fixwell/host/pellar/MessageKeys.h"
#include "pellar/jobs/Meaning.h"
#include "pellar/jobs/Obstacles.h"
#include "pellar/jobs/OutcomeReport.h"
#include "pellar/jobs/ToolRun.h"
#include "pellar/tools/Capability.h"
#include "pellar/tools/ToolTable.h"
#include "pellar/volumes/DiskForTool.h"
#include "pellar/volumes/LogReplay.h"
#include "pellar/volumes/SignatureProbe.h"

#include <utility>

namespace pellar {
namespace {

/// The share of the progress that a repair takes; the verification behind it takes the rest.
constexpr double repairShare = 60;
/// And that of the verification before it.
constexpr double lookShare = 30;

}  // namespace

JobScript::JobScript(JobRequest request, const ManagerOptions& options, const Texts& texts,
                     StopSwitch& stop, EventRoad& road)
    : operation_(request.operation),
      tool_(request.tool),
      options_(options),
      texts_(texts),
      stop_(stop),
      road_(road),
      log_(*request.disk, texts, road),
      disk_(request.disk, std::move(request.claim), std::move(request.mounts), options.systemPaths,
            log_)
{
}

void JobScript::run()
{
    log_.started();
    for (State state = State::Examining; state != State::Done;)
        state = next(state);
    // Given back before it is told, so that the receiver may mount it at once.
    disk_.giveBack();
    tellOutcome(outcome_, operation_, texts_, log_);
}

JobScript::State JobScript::next(State state)
{
    switch (state) {
        case State::Examining: return examine();
        case State::Verifying: return verify();
        case State::Looking: return look();
        case State::Replaying: return replay();
        case State::Repairing: return repair();
        case State::Confirming: return confirm();
        case State::Done: break;
    }
    return State::Done;
}

JobScript::State JobScript::examine()
{
    if (const auto objection = objectionToJob())
        return end(*objection);
    if (const auto refusal = disk_.take(wantedAccess()))
        return end(*refusal);
    // Only where nothing is known: what is listed as something else may hold the remains of a file
    // system that was there before.
    if (tool_ == nullptr && disk_.reference().filesystem.empty())
        tool_ = toolRecognizing(disk_.claim().descriptor(), disk_.claim().offset(),
                                disk_.claim().availableBytes());
    if (tool_ != nullptr) {
        program_ = findProgram(tool_->name, options_.toolPath);
        repairProgram_ = findProgram(tool_->repairName, options_.toolPath);
        volume_ = factsFor(*tool_);
    }
    if (const auto objection = this->objection())
        return end(*objection);
    if (const auto objection = objectionToSize())
        return end(*objection);
    if (operation_ == Operation::Verify)
        return State::Verifying;
    return tool_->habits.isLookedAtBeforeRepair ? State::Looking : State::Repairing;
}

/// Why there is no way, by what the disk is listed as: said before anything is unmounted for it.
std::optional<Outcome> JobScript::objectionToJob() const
{
    if (disk_.reference().filesystem.empty())
        return std::nullopt;
    const Capability capability =
        capabilityFor(disk_.reference().filesystem, operation_, options_.toolPath);
    return capability.isGiven() ? std::nullopt
                                : std::optional(failedOutcome(capability.error, capability.reason));
}

/// Why no tool may run; none when one may.
std::optional<Outcome> JobScript::objection() const
{
    constexpr std::uint64_t smallestVolume = 2048;
    const std::uint64_t available = disk_.claim().availableBytes();
    if (available <= smallestVolume)
        return failedOutcome(fixwell::kPLErrorUnsupported,
                             {"only %1$@ bytes are there, too few for a file system",
                              std::to_string(available),
                              {}});
    if (tool_ == nullptr)
        return withoutTool();
    if (operation_ == Operation::Repair && !tool_->canRepair())
        return failedOutcome(fixwell::kPLErrorUnsupported, tool_->reasonAgainstRepair);
    if (volume_.isForeign)
        return failedOutcome(
            fixwell::kPLErrorUnsupported,
            {"it holds something other than the file system it is listed with", {}, {}});
    if (program_.empty() || (operation_ == Operation::Repair && repairProgram_.empty()))
        return failedOutcome(fixwell::kPLErrorToolMissing,
                             {"%1$@ is not installed (package %2$@)",
                              std::string(program_.empty() ? tool_->name : tool_->repairName),
                              std::string(tool_->package)});
    return std::nullopt;
}

/// What is there is named, where it is something.
Outcome JobScript::withoutTool() const
{
    const std::string type = probeSignature(disk_.claim().descriptor(), disk_.claim().offset(),
                                            disk_.claim().availableBytes())
                                 .type;
    if (type.empty())
        return failedOutcome(fixwell::kPLErrorUnsupported,
                             {"no file system was found that can be checked", {}, {}});
    const Capability capability = capabilityFor(type, operation_, options_.toolPath);
    return failedOutcome(
        fixwell::kPLErrorUnsupported,
        capability.isGiven()
            ? Sentence{"its file system looks like “%1$@”, but too little of it is left",
                       fixwell::printable(type),
                       {}}
            : capability.reason);
}

/// A tool that repairs a volume whose end is missing throws away what it cannot reach.
std::optional<Outcome> JobScript::objectionToSize()
{
    if (!volume_.isCutShort())
        return std::nullopt;
    log_.error({"The volume is cut short: it takes %1$@ bytes, but only %2$@ bytes are there.",
                std::to_string(volume_.volumeBytes), std::to_string(volume_.availableBytes)});
    if (operation_ == Operation::Verify)
        return std::nullopt;
    return Outcome{Verdict::Damaged,
                   fixwell::kPLErrorNotRepaired,
                   0,
                   {"its end is missing, and a repair would throw away what lies there", {}, {}}};
}

JobScript::State JobScript::verify()
{
    const RunEvidence evidence = runOnce(Access::ReadOnly);
    const Judgement judgement = judge(evidence);
    if (judgement.verdict == Verdict::Damaged && !volume_.isCutShort())
        for (const std::string_view meaning : meaningOf(evidence.findings.damage))
            log_.remark(texts_.text(meaning));
    return end(tool_->canRepair() ? outcomeOfVerification(judgement)
                                  : outcomeWithoutRepair(judgement));
}

/// A sound volume is not written to, and what is not known to be damaged is not repaired.
JobScript::State JobScript::look()
{
    log_.meter().setRange(0, lookShare);
    const RunEvidence evidence = runOnce(Access::ReadOnly);
    const Judgement judgement = judge(evidence);
    const bool waitsForReplay = judgement.verdict == Verdict::Inconclusive &&
                                evidence.findings.skippedJournal &&
                                !tool_->habits.logReplayedAs.empty();
    if (waitsForReplay)
        return State::Replaying;
    return judgement.verdict == Verdict::Damaged ? State::Repairing
                                                 : end(outcomeOfVerification(judgement));
}

JobScript::State JobScript::replay()
{
    log_.step(fixwell::kFsckRepair, texts_.text("Replaying the log by mounting the volume"));
    const std::string filesystem(tool_->habits.logReplayedAs);
    log_.trace("replay: the kernel opens it as " + filesystem + " and closes it again");
    road_.flush();
    const auto disk =
        DiskForTool::prepare(disk_.claim(), DiskForTool::Form::BlockDevice, Access::ReadWrite);
    const int* const prepareError = std::get_if<int>(&disk);
    const int error = prepareError != nullptr
                          ? *prepareError
                          : replayLog(filesystem, std::get<DiskForTool>(disk).descriptor());
    if (error != 0)
        return end(notReplayed(error));
    passes_.push_back({{Verdict::Inconclusive, fixwell::kPLErrorInconclusive, 0, {}, true}, true});
    return State::Confirming;
}

JobScript::State JobScript::repair()
{
    log_.meter().setRange(passes_.empty() && tool_->habits.isLookedAtBeforeRepair ? lookShare : 0,
                          repairShare);
    const RunEvidence evidence = runOnce(Access::ReadWrite);
    const Judgement judgement = judge(evidence);
    passes_.push_back({judgement, evidence.findings.replayedJournal,
                       evidence.findings.problems > 0 || tool_->habits.isLookedAtBeforeRepair});
    // The disk went away, or the user did not want more: nothing is left to be confirmed.
    const bool isOver = judgement.verdict == Verdict::Stopped ||
                        judgement.code == fixwell::kPLErrorDiskChanged ||
                        judgement.code == fixwell::kPLErrorDiskInUse;
    return isOver ? end(outcomeOfVerification(judgement)) : State::Confirming;
}

JobScript::State JobScript::confirm()
{
    log_.meter().setRange(repairShare, 100);
    const Judgement judgement = judge(runOnce(Access::ReadOnly));
    if (isWorthAnotherPass(passes_, judgement))
        return State::Repairing;
    const Outcome outcome = outcomeOfRepair(passes_, judgement);
    // The verification behind it decides, but a repair that was cut off is not kept quiet about.
    if (outcome.verdict == Verdict::Sound || outcome.verdict == Verdict::Repaired)
        for (const RepairPass& pass : passes_)
            if (pass.judgement.verdict == Verdict::Failed)
                log_.failure(pass.judgement.reason.in(texts_));
    return end(outcome);
}

JobScript::State JobScript::end(Outcome outcome)
{
    outcome_ = std::move(outcome);
    return State::Done;
}

VolumeFacts JobScript::factsFor(const Tool& tool) const
{
    return tool.examine(disk_.claim().descriptor(), disk_.claim().offset(),
                        disk_.claim().availableBytes());
}

RunEvidence JobScript::runOnce(Access access)
{
    volume_ = factsFor(*tool_);  // the run before may have changed what is to be seen
    const auto form =
        tool_->habits.takesOffset ? DiskForTool::Form::Itself : DiskForTool::Form::VolumeAlone;
    const auto disk = DiskForTool::prepare(disk_.claim(), form, access);
    if (const int* const error = std::get_if<int>(&disk)) {
        obstacle_ = notAttached(*tool_, *error);
        return {access, {NotStarted{*error}}, {}, volume_};
    }
    ToolRun run(*tool_, access == Access::ReadOnly ? program_ : repairProgram_, access,
                {options_, log_, road_, stop_});
    return run.run(std::get<DiskForTool>(disk), volume_);
}

// What was found on a disk that then went away is no answer about the disk that is left.
Judgement JobScript::judge(const RunEvidence& evidence) const
{
    Judgement judgement = obstacle_ ? *obstacle_ : tool_->judge(evidence);
    if (judgement.verdict == Verdict::Stopped)
        return judgement;
    const auto lost = [&judgement](std::string_view reason) {
        return Judgement{Verdict::Failed,
                         fixwell::kPLErrorDiskChanged,
                         judgement.detail,
                         {reason, {}, {}},
                         false};
    };
    if (!disk_.claim().isStillWhole())
        return lost("the disk became shorter or unreadable meanwhile");
    if (!disk_.claim().isStillInPlace())
        return lost("the disk was deleted, moved or replaced meanwhile");
    return judgement;
}

}  // namespace pellar
