// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/JobScript.h"

#include "contract/pellar/ErrorCodes.h"

#include "contract/foundation/UTF8.h"
#include "contract/pellar/MessageKeys.h"
#include "pellar/bytes/Bytes.h"
#include "pellar/disks/DiskClaim.h"
#include "pellar/jobs/LogReplay.h"
#include "pellar/outcome/Damage.h"
#include "pellar/jobs/Obstacles.h"
#include "pellar/jobs/OutcomeReport.h"
#include "pellar/probe/DiskProbe.h"
#include "pellar/tools/Capability.h"
#include "pellar/tools/Judging.h"
#include "pellar/tools/ToolTable.h"

#include <algorithm>
#include <chrono>
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
    if (const auto objection = objectionToDisk())
        return end(*objection);
    if (const auto objection = this->objection())
        return end(*objection);
    if (const auto objection = objectionToSize())
        return end(*objection);
    return operation_ == Operation::Verify ? State::Verifying : State::Looking;
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

/// Where no file system is found in its place, that may be for want of reading.
std::optional<Outcome> JobScript::objectionToDisk()
{
    const bool isInPlace = tool_ != nullptr && volume_.isRecognized && volume_.hasPrimary;
    const auto byte = isInPlace ? std::nullopt : unreadableByte({});
    return byte ? std::optional(outcomeOfVerification(unreadable(byte))) : std::nullopt;
}

/// Why no tool may run; none when one may.
std::optional<Outcome> JobScript::objection() const
{
    constexpr std::uint64_t smallestVolume = 2048;
    const std::uint64_t available = disk_.claim().availableBytes();
    if (available <= smallestVolume)
        return failedOutcome(contract::kPLErrorUnsupported,
                             {"only %1$@ bytes are there, too few for a file system",
                              std::to_string(available),
                              {}});
    if (tool_ == nullptr)
        return withoutTool();
    if (operation_ == Operation::Repair && !tool_->canRepair())
        return failedOutcome(contract::kPLErrorNoRepairHere, tool_->reasonAgainstRepair);
    if (volume_.isForeign)
        return failedOutcome(
            contract::kPLErrorUnsupported,
            {"it holds something other than the file system it is listed with", {}, {}});
    if (program_.empty() || (operation_ == Operation::Repair && repairProgram_.empty()))
        return failedOutcome(contract::kPLErrorToolMissing,
                             {"%1$@ is not installed (package %2$@)",
                              std::string(program_.empty() ? tool_->name : tool_->repairName),
                              std::string(tool_->package)});
    return std::nullopt;
}

/// What is there is named, where it is something.
Outcome JobScript::withoutTool() const
{
    const DiskClaim& claim = disk_.claim();
    const std::string type =
        readSuperblock(claim.descriptor(), {claim.offset(), claim.availableBytes()}).type;
    if (type.empty())
        return failedOutcome(contract::kPLErrorUnsupported,
                             {"no file system was found that can be checked", {}, {}});
    const Capability capability = capabilityFor(type, operation_, options_.toolPath);
    return failedOutcome(
        contract::kPLErrorUnsupported,
        capability.isGiven()
            ? Sentence{"its file system looks like “%1$@”, but too little of it is left",
                       contract::printable(type),
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
    return outcomeOfVerification(cutShort(0));
}

JobScript::State JobScript::verify()
{
    const RunEvidence evidence = runOnce(Access::ReadOnly, ToolRun::Problems::Shown);
    const Judgement judgement = judge(evidence);
    if (judgement.verdict == Verdict::Damaged && !volume_.isCutShort())
        tellMeaning(evidence);
    return end(tool_->canRepair() ? outcomeOfVerification(judgement)
                                  : outcomeWithoutRepair(judgement));
}

void JobScript::tellMeaning(const RunEvidence& evidence)
{
    Damage damage = evidence.findings.damage;
    if (!evidence.findings.isComplete)
        damage.add(Damage::Unsurveyed);
    for (const std::string_view meaning : meaningOf(damage, tool_->canRepair()))
        log_.remark(texts_.text(meaning));
}

/// A sound volume is not written to, what is not known to be damaged is not repaired, and nothing
/// is written to a disk that cannot be read.
JobScript::State JobScript::look()
{
    log_.meter().setRange(0, lookShare);
    // What is wrong before a journal is replayed may not be wrong afterwards.
    const bool hasJournal = volume_.needsRecovery;
    const RunEvidence evidence =
        runOnce(Access::ReadOnly, hasJournal ? ToolRun::Problems::Kept : ToolRun::Problems::Shown);
    const Judgement judgement = judge(evidence);
    counts_.collectedOne = tool_->habits.collectedOne;
    counts_.collectedMany = tool_->habits.collectedMany;
    counts_.before = evidence.volume.files ? evidence.volume.files : evidence.findings.files;
    foundDamage_ = judgement.verdict == Verdict::Damaged;
    const bool waitsForReplay =
        judgement.verdict == Verdict::Inconclusive && evidence.findings.skippedJournal;
    if (waitsForReplay && !tool_->habits.logReplayedAs.empty())
        return State::Replaying;
    if (!foundDamage_ && !(waitsForReplay && tool_->habits.replaysInRepair))
        return end(outcomeOfVerification(judgement));
    const auto byte = firstUnreadable(evidence.volume.backups);
    return byte ? end(outcomeOfVerification(unreadable(byte))) : State::Repairing;
}

JobScript::State JobScript::replay()
{
    log_.step(contract::kFsckRepair, texts_.text("Replaying the log by mounting the volume"));
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
    passes_.push_back({{Verdict::Inconclusive, contract::kPLErrorInconclusive, 0, {}, true}, true});
    return State::Confirming;
}

JobScript::State JobScript::repair()
{
    log_.meter().setRange(passes_.empty() ? lookShare : 0, repairShare);
    const RunEvidence evidence = runOnce(
        Access::ReadWrite, foundDamage_ ? ToolRun::Problems::Kept : ToolRun::Problems::Shown);
    const Judgement judgement = judge(evidence);
    passes_.push_back({judgement, evidence.findings.replayedJournal,
                       evidence.findings.problems > 0 || foundDamage_});
    counts_.reconnected += evidence.findings.reconnected;
    counts_.cleared += evidence.findings.cleared;
    // The disk went away, or the user did not want more: nothing is left to be confirmed.
    const bool isOver = judgement.verdict == Verdict::Stopped ||
                        judgement.code == contract::kPLErrorUnreadable ||
                        judgement.code == contract::kPLErrorDiskChanged ||
                        judgement.code == contract::kPLErrorDiskInUse;
    return isOver ? end(outcomeOfVerification(judgement)) : State::Confirming;
}

JobScript::State JobScript::confirm()
{
    log_.meter().setRange(repairShare, 100);
    const RunEvidence evidence = runOnce(Access::ReadOnly, ToolRun::Problems::Shown);
    const Judgement judgement = judge(evidence);
    if (isWorthAnotherPass(passes_, judgement))
        return State::Repairing;
    counts_.after = evidence.findings.files;
    const Outcome outcome = outcomeOfRepair(passes_, judgement, counts_);
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

RunEvidence JobScript::runOnce(Access access, ToolRun::Problems problems)
{
    volume_ = factsFor(*tool_);  // the run before may have changed what is to be seen
    const auto form =
        tool_->habits.takesOffset ? DiskForTool::Form::Itself : DiskForTool::Form::VolumeAlone;
    const auto disk = DiskForTool::prepare(disk_.claim(), form, access);
    if (const int* const error = std::get_if<int>(&disk)) {
        obstacle_ = notAttached(*tool_, *error);
        return {access, {NotStarted{*error}}, {}, volume_};
    }
    ToolRun run(*tool_, access == Access::ReadOnly ? program_ : repairProgram_, access, problems,
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
                         contract::kPLErrorDiskChanged,
                         judgement.detail,
                         {reason, {}, {}},
                         false};
    };
    if (!disk_.claim().isStillWhole())
        return lost("the disk became shorter meanwhile");
    if (!disk_.claim().isStillInPlace())
        return lost("the disk was deleted, moved or replaced meanwhile");
    if (!disk_.claim().isEndReadable())
        return unreadable(disk_.claim().availableBytes() - 1);
    return asKernelSays(judgement, evidence);
}

/// What a tool takes for damage may be a disk that cannot be read, which not every tool says.
Judgement JobScript::asKernelSays(const Judgement& judgement, const RunEvidence& evidence) const
{
    const bool isAnswer =
        judgement.code == contract::kPLErrorUnreadable || judgement.code == contract::kPLErrorDamaged ||
        judgement.code == contract::kPLErrorCutShort || judgement.code == contract::kPLErrorInconclusive ||
        judgement.code == contract::kPLErrorToolFailed;
    if (obstacle_ || !isAnswer || stop_.isPressed() ||
        std::holds_alternative<NotStarted>(evidence.result.ending))
        return judgement;
    const auto byte = unreadableByte(evidence.findings.readFault.value_or(ReadFault()));
    return byte ? unreadable(byte) : judgement;
}

/// Our own reading of where the tool could not, and of where a file system keeps what it is built
/// on; of all, for half a minute, where a tool could not read and does not say where.
std::optional<std::uint64_t> JobScript::unreadableByte(const ReadFault& fault) const
{
    constexpr std::uint64_t around = 1U << 20U;
    const std::uint64_t available = disk_.claim().availableBytes();
    std::vector<DiskPiece> pieces = endsOfVolume(available);
    const auto byte =
        fault.block ? productOrGreatest(*fault.block, volume_.blockBytes) : fault.byte;
    if (byte && *byte < available)
        pieces.insert(pieces.begin(), {*byte, std::min(around, available - *byte)});
    else if (fault.isUnproven)
        pieces.push_back({0, available});
    return firstUnreadable(pieces);
}

std::optional<std::uint64_t> JobScript::firstUnreadable(const std::vector<DiskPiece>& pieces) const
{
    const auto deadline = Clock::now() + std::chrono::seconds(30);
    return pellar::firstUnreadable(disk_.claim().descriptor(), disk_.claim().offset(), pieces,
                                   [&] { return stop_.isPressed() || Clock::now() > deadline; });
}

}  // namespace pellar
