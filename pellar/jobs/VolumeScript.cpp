// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/VolumeScript.h"

#include "contract/foundation/UTF8.h"
#include "contract/pellar/ErrorCodes.h"
#include "contract/pellar/MessageKeys.h"
#include "pellar/disks/DiskClaim.h"
#include "pellar/jobs/RepairApplication.h"
#include "pellar/jobs/RepairPreview.h"
#include "pellar/outcome/Damage.h"
#include "pellar/probe/DiskProbe.h"
#include "pellar/tools/Capability.h"
#include "pellar/tools/Judging.h"
#include "pellar/tools/ToolTable.h"

#include <utility>

namespace pellar {
namespace {

// The shares of the progress, in per cent: the verification before a repair ends here,
constexpr double lookEnds = 30;
/// and the trial of a repair here.
constexpr double trialEnds = 85;
/// The verification before a trial that decides.
constexpr double readingEnds = 40;

/// Whether another run can tell more than the verification did.
bool isOpen(const Judgement& judgement, const RunEvidence& evidence)
{
    const bool waits = judgement.verdict == Verdict::Inconclusive &&
                       (evidence.findings.skippedJournal || evidence.volume.needsRecovery);
    const bool brokeOff = judgement.code == contract::kPLErrorToolFailed &&
                          !std::holds_alternative<NotStarted>(evidence.result.ending);
    return waits || brokeOff;
}

bool isProven(const Outcome& outcome)
{
    return outcome.verdict == Verdict::Sound || outcome.verdict == Verdict::Repaired;
}

/// How a job ends whose trial did not end in a sound volume.
Outcome notProven(Outcome outcome, bool foundDamage)
{
    const bool isUnknown = outcome.verdict == Verdict::Inconclusive && foundDamage;
    if (outcome.verdict != Verdict::Damaged && !isUnknown)
        return outcome;
    if (isUnknown)
        outcome.reason = {
            "a repair was tried, and it cannot be told whether it makes it sound; "
            "nothing was written",
            {},
            {}};
    else
        outcome.reason = {
            "a repair was tried, and would leave damage; nothing was written", {}, {}};
    outcome.verdict = Verdict::Damaged;
    outcome.code = contract::kPLErrorNotProven;
    return outcome;
}

}  // namespace

VolumeScript::VolumeScript(VolumeRequest request, JobContext context)
    : operation_(request.operation),
      tool_(request.tool),
      context_(std::move(context)),
      disk_(request.disk, std::move(request.claim), std::move(request.mounts),
            context_.options.systemPaths, log_)
{
}

void VolumeScript::run()
{
    log_.started();
    for (State state = State::Examining; state != State::Done;)
        state = next(state);
    // Given back before it is told, so that the receiver may mount it at once.
    disk_.giveBack();
    log_.outcomeOfVolume(outcome_, context_.policy.isPreview ? Operation::Verify : operation_);
}

VolumeScript::State VolumeScript::next(State state)
{
    switch (state) {
        case State::Examining: return examine();
        case State::Verifying: return verify();
        case State::Deciding: return decide();
        case State::Looking: return look();
        case State::Repairing: return repair();
        case State::Trying: return tryRepair();
        case State::Applying: return apply();
        case State::Done: break;
    }
    return State::Done;
}

VolumeScript::State VolumeScript::examine()
{
    if (const auto objection = objectionToJob())
        return end(*objection);
    if (const auto refusal = disk_.take(accessFor(operation_, context_.policy)))
        return end(*refusal);
    if (const auto objection = objectionToHistory())
        return end(*objection);
    // Only where nothing is known: what is listed as something else may hold the remains of a file
    // system that was there before.
    if (tool_ == nullptr && disk_.reference().filesystem.empty())
        tool_ = toolRecognizing(disk_.claim().descriptor(), disk_.claim().offset(),
                                disk_.claim().availableBytes());
    if (tool_ != nullptr)
        runs_.choose(*tool_);
    if (const auto objection = objectionToDisk())
        return end(*objection);
    if (const auto objection = this->objection())
        return end(*objection);
    if (const auto objection = objectionToSize())
        return end(*objection);
    return operation_ == Operation::Verify ? State::Verifying : State::Looking;
}

/// Why there is no way, by what the disk is listed as: said before anything is unmounted for it.
std::optional<Outcome> VolumeScript::objectionToJob() const
{
    if (disk_.reference().filesystem.empty())
        return std::nullopt;
    const Capability capability = capabilityFor(disk_.reference().filesystem, operation_,
                                                context_.options.toolPath, context_.repairWay());
    return capability.isGiven() ? std::nullopt
                                : std::optional(failedOutcome(capability.error, capability.reason));
}

/// What is half repaired is as it was neither before nor after.
std::optional<Outcome> VolumeScript::objectionToHistory()
{
    const auto directory = recordsIn(context_.options.trials);
    if (context_.options.trials.room.directory.empty() || !std::filesystem::exists(directory))
        return std::nullopt;
    const auto store = openRecords(context_.options.trials);
    if (!store)
        return std::nullopt;
    const DiskClaim& claim = disk_.claim();
    const RecordList list = store->list();
    const ListedRecord* const newest =
        newestOf(recordedDisk(disk_.reference(), claim.descriptor(),
                              {claim.offset(), claim.availableBytes()}),
                 list);
    if (newest == nullptr || !newest->isInterrupted())
        return std::nullopt;
    const Sentence reason{
        "an earlier repair of it was interrupted; finish it or undo it first", {}, {}};
    if (operation_ == Operation::Repair && !context_.policy.isPreview)
        return failedOutcome(contract::kPLErrorInterrupted, reason);
    log_.error(Sentence{"An earlier repair of “%1$@” was interrupted; finish it or undo it first.",
                        log_.diskName(),
                        {}});
    return std::nullopt;
}

/// Where no file system is found in its place, that may be for want of reading.
std::optional<Outcome> VolumeScript::objectionToDisk()
{
    const VolumeFacts& volume = runs_.volume();
    const bool isInPlace = tool_ != nullptr && volume.isRecognized && volume.hasPrimary;
    const auto byte = isInPlace ? std::nullopt : runs_.unreadableByte({});
    return byte ? std::optional(outcomeOfVerification(unreadable(byte))) : std::nullopt;
}

/// Why no tool may run; none when one may.
std::optional<Outcome> VolumeScript::objection() const
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
    if (context_.policy.isPreview && context_.repairWay() == RepairWay::Direct)
        return failedOutcome(contract::kPLErrorNotTried,
                             {"there is no directory to keep what it would write", {}, {}});
    if (operation_ == Operation::Repair && !tool_->repairs(context_.repairWay()))
        return failedOutcome(contract::kPLErrorNoRepairHere, tool_->reasonAgainstDirectRepair);
    if (runs_.volume().isForeign)
        return failedOutcome(
            contract::kPLErrorUnsupported,
            {"it holds something other than the file system it is listed with", {}, {}});
    const bool isRepair = operation_ == Operation::Repair;
    const bool hasReader = !runs_.program(Access::ReadOnly).empty();
    if (!hasReader || (isRepair && runs_.program(Access::ReadWrite).empty()))
        return failedOutcome(contract::kPLErrorToolMissing,
                             {"%1$@ is not installed (package %2$@)",
                              std::string(hasReader ? tool_->repairName : tool_->name),
                              std::string(tool_->package)});
    return std::nullopt;
}

/// What is there is named, where it is something.
Outcome VolumeScript::withoutTool() const
{
    const DiskClaim& claim = disk_.claim();
    const std::string type =
        readSuperblock(claim.descriptor(), {claim.offset(), claim.availableBytes()}).type;
    if (type.empty())
        return failedOutcome(contract::kPLErrorUnsupported,
                             {"no file system was found that can be checked", {}, {}});
    const Capability capability =
        capabilityFor(type, operation_, context_.options.toolPath, context_.repairWay());
    return failedOutcome(
        contract::kPLErrorUnsupported,
        capability.isGiven()
            ? Sentence{"its file system looks like “%1$@”, but too little of it is left",
                       contract::printable(type),
                       {}}
            : capability.reason);
}

/// A tool that repairs a volume whose end is missing throws away what it cannot reach.
std::optional<Outcome> VolumeScript::objectionToSize()
{
    const VolumeFacts& volume = runs_.volume();
    if (!volume.isCutShort())
        return std::nullopt;
    log_.error({"The volume is cut short: it takes %1$@ bytes, but only %2$@ bytes are there.",
                std::to_string(volume.volumeBytes), std::to_string(volume.availableBytes)});
    if (operation_ == Operation::Verify)
        return std::nullopt;
    return outcomeOfVerification(cutShort(0));
}

VolumeScript::State VolumeScript::verify()
{
    const bool isTried = context_.repairWay() == RepairWay::TriedFirst;
    const bool isThorough = context_.policy.isThorough && isTried;
    // What is wrong before a journal is replayed may not be wrong afterwards.
    const bool hasJournal = runs_.volume().needsRecovery && isTried;
    log_.meter().setRange(0, isThorough || hasJournal ? readingEnds : 100);
    const RunEvidence evidence = runs_.run(
        Access::ReadOnly, hasJournal ? ToolRun::Problems::Kept : ToolRun::Problems::Shown);
    const Judgement judgement = runs_.judgeWithLog(evidence);
    const bool canBeRepaired = tool_->repairs(context_.repairWay());
    if (judgement.verdict == Verdict::Damaged)
        log_.tellProblems();
    if (judgement.verdict == Verdict::Damaged && !runs_.volume().isCutShort())
        tellMeaning(evidence);
    outcome_ = canBeRepaired ? outcomeOfVerification(judgement) : outcomeWithoutRepair(judgement);
    if (judgement.verdict == Verdict::Sound && hasJournal)
        tellJournal();
    look_.waitsForMount = evidence.findings.skippedJournal && !tool_->habits.logReplayedAs.empty();
    const bool isWorthATrial =
        isOpen(judgement, evidence) || (isThorough && judgement.verdict == Verdict::Sound);
    const bool isPossible = isTried && canBeRepaired && !runs_.program(Access::ReadWrite).empty() &&
                            !runs_.volume().isCutShort();
    return isWorthATrial && isPossible ? State::Deciding : State::Done;
}

void VolumeScript::tellMeaning(const RunEvidence& evidence)
{
    Damage damage = evidence.findings.damage;
    if (!evidence.findings.isComplete)
        damage.add(Damage::Unsurveyed);
    for (const std::string_view meaning : meaningOf(damage, tool_->repairs(context_.repairWay())))
        log_.remark(Sentence{meaning, {}, {}});
}

void VolumeScript::tellJournal()
{
    log_.remark(
        Sentence{"Its journal waits to be replayed, which mounting it does; with that, no "
                 "damage was found.",
                 {},
                 {}});
}

/// What a repair finds and changes is known once it is done; so it is done where the disk stays as
/// it is.
VolumeScript::State VolumeScript::decide()
{
    log_.step(Operation::Verify,
              {"Trying a repair to know more; nothing is written to “%1$@”", log_.diskName(), {}});
    if (const auto obstacle = beginTrial()) {
        log_.remark(
            Sentence{"More could be known by trying a repair, which cannot be done here: "
                     "%1$@.",
                     log_.text(*obstacle),
                     {}});
        return State::Done;
    }
    RepairPasses passes(runs_, context_, look_, {readingEnds, 100});
    const Outcome tried = passes.run();
    return end(decidedBy(tried, passes.foundProblems()));
}

/// Where the trial came to no answer, that of the verification stands.
Outcome VolumeScript::decidedBy(const Outcome& tried, bool foundProblems)
{
    if (tried.verdict == Verdict::Stopped || tried.code == contract::kPLErrorUnreadable ||
        tried.code == contract::kPLErrorDiskChanged)
        return tried;
    if (!isProven(tried) && tried.verdict != Verdict::Damaged)
        return outcome_;
    if (isProven(tried) && !foundProblems) {
        if (outcome_.verdict == Verdict::Inconclusive)
            tellJournal();
        return outcome_.code == contract::kPLErrorToolFailed
                   ? outcome_  // the tool broke off, and has not said over what
                   : outcomeOfVerification(sound(0));
    }
    log_.tellProblems();
    log_.remark(Sentence{isProven(tried) ? "A repair was tried; it would make the volume sound."
                                         : "A repair was tried; it would leave damage.",
                         {},
                         {}});
    return outcomeOfVerification(damaged(0));
}

/// A sound volume is not written to, what is not known to be damaged is not repaired, and nothing
/// is written to a disk that cannot be read.
VolumeScript::State VolumeScript::look()
{
    log_.meter().setRange(0, lookEnds);
    // What is wrong before a journal is replayed may not be wrong afterwards.
    const bool hasJournal = runs_.volume().needsRecovery;
    const RunEvidence evidence = runs_.run(
        Access::ReadOnly, hasJournal ? ToolRun::Problems::Kept : ToolRun::Problems::Shown);
    const Judgement judgement = runs_.judgeWithLog(evidence);
    look_.counts.collectedOne = tool_->habits.collectedOne;
    look_.counts.collectedMany = tool_->habits.collectedMany;
    look_.counts.before = evidence.volume.files ? evidence.volume.files : evidence.findings.files;
    look_.foundDamage = judgement.verdict == Verdict::Damaged;
    if (look_.foundDamage)
        log_.tellProblems();
    const bool waitsForReplay =
        judgement.verdict == Verdict::Inconclusive && evidence.findings.skippedJournal;
    look_.waitsForMount = waitsForReplay && !tool_->habits.logReplayedAs.empty();
    const bool isTried = context_.repairWay() == RepairWay::TriedFirst;
    const bool isToBeRepaired =
        look_.foundDamage || look_.waitsForMount ||
        (waitsForReplay && tool_->habits.replaysInRepair) ||
        (isTried && (isOpen(judgement, evidence) ||
                     (context_.policy.isThorough && judgement.verdict == Verdict::Sound)));
    if (!isToBeRepaired)
        return end(outcomeOfVerification(judgement));
    const auto byte = runs_.firstUnreadable(evidence.volume.backups);
    if (byte && !look_.waitsForMount)
        return end(outcomeOfVerification(unreadable(byte)));
    return isTried ? State::Trying : State::Repairing;
}

VolumeScript::State VolumeScript::repair()
{
    return end(RepairPasses(runs_, context_, look_, {lookEnds, 100}).run());
}

VolumeScript::State VolumeScript::tryRepair()
{
    log_.step(Operation::Repair, {"Trying the repair; nothing is written to “%1$@” until it is "
                                  "proven",
                                  log_.diskName(),
                                  {}});
    mark_ = WriteMark::of(disk_.claim().descriptor());
    if (const auto obstacle = beginTrial()) {
        context_.advise(context_.options.trials.howToRepairDirectly);
        return end(
            failedOutcome(contract::kPLErrorNotTried,
                          {"the repair cannot be tried first: %1$@", log_.text(*obstacle), {}}));
    }
    RepairPasses passes(runs_, context_, look_, {lookEnds, trialEnds});
    outcome_ = passes.run();
    look_.counts = passes.counts();
    runs_.workOn(nullptr);
    if (context_.policy.isPreview || isProven(outcome_))
        return State::Applying;
    const Outcome end = notProven(outcome_, look_.foundDamage);
    if (end.code == contract::kPLErrorNotProven && context_.policy.appliesUnproven)
        return State::Applying;
    if (end.code == contract::kPLErrorNotProven)
        context_.advise(context_.options.trials.howToApply);
    return this->end(end);
}

VolumeScript::State VolumeScript::apply()
{
    if (context_.policy.isPreview)
        return end(
            RepairPreview(context_, *tool_, *trial_, disk_.claim()).tell(outcome_, look_.counts));
    return end(applyTrial(*trial_, mark_, disk_, context_, outcome_));
}

/// Why there is none; the tool works on it from now on.
std::optional<Sentence> VolumeScript::beginTrial()
{
    const DiskClaim& claim = disk_.claim();
    auto trial =
        TrialDisk::of(claim.descriptor(), {claim.offset(), claim.availableBytes()},
                      context_.options.trials.room, [this] { return context_.stop.isPressed(); });
    if (!trial)
        return trial.error();
    trial_.emplace(*std::move(trial));
    runs_.workOn(&*trial_);
    return std::nullopt;
}

VolumeScript::State VolumeScript::end(Outcome outcome)
{
    outcome_ = std::move(outcome);
    return State::Done;
}

}  // namespace pellar
