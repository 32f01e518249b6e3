// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/VolumeScript.h"

#include "contract/foundation/UTF8.h"
#include "contract/pellar/ErrorCodes.h"
#include "contract/pellar/MessageKeys.h"
#include "pellar/bytes/Bytes.h"
#include "pellar/disks/DiskClaim.h"
#include "pellar/outcome/Damage.h"
#include "pellar/probe/DiskProbe.h"
#include "pellar/process/FileDescriptor.h"
#include "pellar/tools/Capability.h"
#include "pellar/tools/Judging.h"
#include "pellar/tools/ToolTable.h"

#include <sys/mount.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstring>
#include <utility>

namespace pellar {
namespace {

bool isMissingRight(int error)
{
    return error == EPERM || error == EACCES;
}

std::string textOf(int error)
{
    return ::strerrordesc_np(error);
}

/// The share of the progress that a repair takes; the verification behind it takes the rest.
constexpr double repairShare = 60;
/// And that of the verification before it.
constexpr double lookShare = 30;

}  // namespace

Judgement notAttached(const Tool& tool, int error)
{
    const std::string name(tool.name);
    const Sentence reason =
        isMissingRight(error)
            ? Sentence{"%1$@ needs the volume as a disk of its own, which only an administrator "
                       "may make of a part of an image",
                       name,
                       {}}
            : Sentence{"the volume could not be made a disk of its own for %1$@: %2$@", name,
                       textOf(error)};
    return {Verdict::Failed, contract::kPLErrorCannotOpen, error, reason};
}

Outcome notReplayed(int error)
{
    const Sentence reason =
        isMissingRight(error)
            ? Sentence{"its log has to be replayed by mounting it, which only an administrator may",
                       {},
                       {}}
            : Sentence{"its log could not be replayed by mounting it: %1$@", textOf(error), {}};
    return {Verdict::Inconclusive, contract::kPLErrorInconclusive, error, reason};
}

int replayLog(const std::string& filesystem, int device)
{
    const FileDescriptor context(::fsopen(filesystem.c_str(), FSOPEN_CLOEXEC));
    if (!context)
        return errno;
    const std::string source = pathOfDescriptor(device);
    if (::fsconfig(context.get(), FSCONFIG_SET_STRING, "source", source.c_str(), 0) != 0)
        return errno;
    // A copy of a volume has its UUID, and the volume itself may be mounted (xfs(5)).
    if (filesystem == "xfs" &&
        ::fsconfig(context.get(), FSCONFIG_SET_FLAG, "nouuid", nullptr, 0) != 0)
        return errno;
    return ::fsconfig(context.get(), FSCONFIG_CMD_CREATE, nullptr, nullptr, 0) == 0 ? 0 : errno;
}

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
    log_.outcomeOfVolume(outcome_, operation_);
}

VolumeScript::State VolumeScript::next(State state)
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

VolumeScript::State VolumeScript::examine()
{
    if (const auto objection = objectionToJob())
        return end(*objection);
    if (const auto refusal = disk_.take(accessFor(operation_)))
        return end(*refusal);
    // Only where nothing is known: what is listed as something else may hold the remains of a file
    // system that was there before.
    if (tool_ == nullptr && disk_.reference().filesystem.empty())
        tool_ = toolRecognizing(disk_.claim().descriptor(), disk_.claim().offset(),
                                disk_.claim().availableBytes());
    if (tool_ != nullptr) {
        program_ = findProgram(tool_->name, context_.options.toolPath);
        repairProgram_ = findProgram(tool_->repairName, context_.options.toolPath);
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
std::optional<Outcome> VolumeScript::objectionToJob() const
{
    if (disk_.reference().filesystem.empty())
        return std::nullopt;
    const Capability capability =
        capabilityFor(disk_.reference().filesystem, operation_, context_.options.toolPath);
    return capability.isGiven() ? std::nullopt
                                : std::optional(failedOutcome(capability.error, capability.reason));
}

/// Where no file system is found in its place, that may be for want of reading.
std::optional<Outcome> VolumeScript::objectionToDisk()
{
    const bool isInPlace = tool_ != nullptr && volume_.isRecognized && volume_.hasPrimary;
    const auto byte = isInPlace ? std::nullopt : unreadableByte({});
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
Outcome VolumeScript::withoutTool() const
{
    const DiskClaim& claim = disk_.claim();
    const std::string type =
        readSuperblock(claim.descriptor(), {claim.offset(), claim.availableBytes()}).type;
    if (type.empty())
        return failedOutcome(contract::kPLErrorUnsupported,
                             {"no file system was found that can be checked", {}, {}});
    const Capability capability = capabilityFor(type, operation_, context_.options.toolPath);
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
    if (!volume_.isCutShort())
        return std::nullopt;
    log_.error({"The volume is cut short: it takes %1$@ bytes, but only %2$@ bytes are there.",
                std::to_string(volume_.volumeBytes), std::to_string(volume_.availableBytes)});
    if (operation_ == Operation::Verify)
        return std::nullopt;
    return outcomeOfVerification(cutShort(0));
}

VolumeScript::State VolumeScript::verify()
{
    const RunEvidence evidence = runOnce(Access::ReadOnly, ToolRun::Problems::Shown);
    const Judgement judgement = judge(evidence);
    if (judgement.verdict == Verdict::Damaged && !volume_.isCutShort())
        tellMeaning(evidence);
    return end(tool_->canRepair() ? outcomeOfVerification(judgement)
                                  : outcomeWithoutRepair(judgement));
}

void VolumeScript::tellMeaning(const RunEvidence& evidence)
{
    Damage damage = evidence.findings.damage;
    if (!evidence.findings.isComplete)
        damage.add(Damage::Unsurveyed);
    for (const std::string_view meaning : meaningOf(damage, tool_->canRepair()))
        log_.remark(Sentence{meaning, {}, {}});
}

/// A sound volume is not written to, what is not known to be damaged is not repaired, and nothing
/// is written to a disk that cannot be read.
VolumeScript::State VolumeScript::look()
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

VolumeScript::State VolumeScript::replay()
{
    log_.step(Operation::Repair, {"Replaying the log by mounting the volume", {}, {}});
    const std::string filesystem(tool_->habits.logReplayedAs);
    log_.trace("replay: the kernel opens it as " + filesystem + " and closes it again");
    log_.flush();
    const auto disk =
        DiskForTool::prepare(disk_.claim(), DiskForTool::Form::BlockDevice, Access::ReadWrite);
    const int error = disk ? replayLog(filesystem, disk->descriptor()) : disk.error();
    if (error != 0)
        return end(notReplayed(error));
    passes_.push_back({{Verdict::Inconclusive, contract::kPLErrorInconclusive, 0, {}, true}, true});
    return State::Confirming;
}

VolumeScript::State VolumeScript::repair()
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

VolumeScript::State VolumeScript::confirm()
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
                log_.failure(pass.judgement.reason);
    return end(outcome);
}

VolumeScript::State VolumeScript::end(Outcome outcome)
{
    outcome_ = std::move(outcome);
    return State::Done;
}

VolumeFacts VolumeScript::factsFor(const Tool& tool) const
{
    return tool.examine(disk_.claim().descriptor(), disk_.claim().offset(),
                        disk_.claim().availableBytes());
}

RunEvidence VolumeScript::runOnce(Access access, ToolRun::Problems problems)
{
    volume_ = factsFor(*tool_);  // the run before may have changed what is to be seen
    const auto form =
        tool_->habits.takesOffset ? DiskForTool::Form::Itself : DiskForTool::Form::VolumeAlone;
    const auto disk = DiskForTool::prepare(disk_.claim(), form, access);
    if (!disk) {
        obstacle_ = notAttached(*tool_, disk.error());
        return {access, {NotStarted{disk.error()}}, {}, volume_};
    }
    ToolRun run(*tool_, access == Access::ReadOnly ? program_ : repairProgram_, access, problems,
                context_);
    return run.run(*disk, volume_);
}

// What was found on a disk that then went away is no answer about the disk that is left.
Judgement VolumeScript::judge(const RunEvidence& evidence) const
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
Judgement VolumeScript::asKernelSays(const Judgement& judgement, const RunEvidence& evidence) const
{
    const bool isAnswer = judgement.code == contract::kPLErrorUnreadable ||
                          judgement.code == contract::kPLErrorDamaged ||
                          judgement.code == contract::kPLErrorCutShort ||
                          judgement.code == contract::kPLErrorInconclusive ||
                          judgement.code == contract::kPLErrorToolFailed;
    if (obstacle_ || !isAnswer || context_.stop.isPressed() ||
        std::holds_alternative<NotStarted>(evidence.result.ending))
        return judgement;
    const auto byte = unreadableByte(evidence.findings.readFault.value_or(ReadFault()));
    return byte ? unreadable(byte) : judgement;
}

/// Our own reading of where the tool could not, and of where a file system keeps what it is built
/// on; of all, for half a minute, where a tool could not read and does not say where.
std::optional<std::uint64_t> VolumeScript::unreadableByte(const ReadFault& fault) const
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

std::optional<std::uint64_t> VolumeScript::firstUnreadable(
    const std::vector<DiskPiece>& pieces) const
{
    const auto deadline = Clock::now() + std::chrono::seconds(30);
    return pellar::firstUnreadable(disk_.claim().descriptor(), disk_.claim().offset(), pieces, [&] {
        return context_.stop.isPressed() || Clock::now() > deadline;
    });
}

}  // namespace pellar
