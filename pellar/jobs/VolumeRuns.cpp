// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/VolumeRuns.h"

#include "contract/pellar/ErrorCodes.h"
#include "pellar/bytes/Bytes.h"
#include "pellar/process/FileDescriptor.h"
#include "pellar/tools/Judging.h"

#include <sys/mount.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstring>
#include <utility>

namespace pellar {
namespace {

Judgement notAttached(const Tool& tool, int error)
{
    const std::string name(tool.name);
    const Sentence reason =
        error == EPERM || error == EACCES
            ? Sentence{"%1$@ needs the volume as a disk of its own, which only an administrator "
                       "may make of a part of an image",
                       name,
                       {}}
            : Sentence{"the volume could not be made a disk of its own for %1$@: %2$@", name,
                       ::strerrordesc_np(error)};
    return failed(error, reason, contract::kPLErrorCannotOpen);
}

Judgement outOfRoom()
{
    return failed(ENOSPC, {"there is no room to keep what the repair would write", {}, {}});
}

/// The kernel replays the log of a file system as it opens it, before anything is mounted.
int openAndClose(const std::string& filesystem, int device)
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

}  // namespace

void VolumeRuns::choose(const Tool& tool)
{
    tool_ = &tool;
    program_ = findProgram(tool.name, context_.options.toolPath);
    repairProgram_ = findProgram(tool.repairName, context_.options.toolPath);
    volume_ = facts();
}

VolumeFacts VolumeRuns::facts() const
{
    if (trial_ != nullptr)
        return tool_->examine(trial_->descriptor(), 0, trial_->bytes());
    const DiskClaim& claim = disk_.claim();
    return tool_->examine(claim.descriptor(), claim.offset(), claim.availableBytes());
}

Result<DiskForTool, int> VolumeRuns::prepare(DiskForTool::Form form, Access access)
{
    if (trial_ != nullptr)
        return DiskForTool::prepare(trial_->descriptor(), trial_->bytes(), form, access);
    auto disk = DiskForTool::prepare(disk_.claim(), form, access);
    const bool isRefused = !disk && (disk.error() == EPERM || disk.error() == EACCES);
    const bool isView = form == DiskForTool::Form::VolumeAlone && access == Access::ReadOnly &&
                        context_.repairWay() == RepairWay::TriedFirst;
    return isRefused && isView ? prepareView() : std::move(disk);
}

/// What a tool reads of a part of an image needs no device, which takes root: a trial shows it that
/// part.
Result<DiskForTool, int> VolumeRuns::prepareView()
{
    const DiskClaim& claim = disk_.claim();
    auto view = TrialDisk::of(claim.descriptor(), {claim.offset(), claim.availableBytes()},
                              context_.options.trials.room);
    if (!view)
        return EPERM;
    view_.emplace(*std::move(view));
    return DiskForTool::prepare(view_->descriptor(), view_->bytes(), DiskForTool::Form::VolumeAlone,
                                Access::ReadOnly);
}

RunEvidence VolumeRuns::run(Access access, ToolRun::Problems problems)
{
    volume_ = facts();  // the run before may have changed what is to be seen
    return runOn(access, problems, {});
}

RunEvidence VolumeRuns::runOn(Access access, ToolRun::Problems problems,
                              const std::vector<std::uint64_t>& logParts)
{
    const auto form =
        tool_->habits.takesOffset ? DiskForTool::Form::Itself : DiskForTool::Form::VolumeAlone;
    const auto disk = prepare(form, access);
    if (!disk) {
        obstacle_ = notAttached(*tool_, disk.error());
        return {access, {NotStarted{disk.error()}}, {}, volume_};
    }
    ToolRun run(*tool_, program(access), access, problems, context_);
    if (!logParts.empty())
        run.readLog(logParts);
    return run.run(*disk, volume_);
}

int VolumeRuns::replayLog()
{
    const std::string filesystem(tool_->habits.logReplayedAs);
    context_.log.trace("replay: the kernel opens it as " + filesystem + " and closes it again");
    context_.log.flush();
    const auto disk = prepare(DiskForTool::Form::BlockDevice, Access::ReadWrite);
    return disk ? openAndClose(filesystem, disk->descriptor()) : disk.error();
}

// What was found on a disk that then went away is no answer about the disk that is left.
Judgement VolumeRuns::judge(const RunEvidence& evidence) const
{
    Judgement judgement = obstacle_ ? *obstacle_ : tool_->judge(evidence);
    if (judgement.verdict == Verdict::Stopped)
        return judgement;
    const auto lost = [&judgement](std::string_view reason) {
        return failed(judgement.detail, {reason, {}, {}}, contract::kPLErrorDiskChanged);
    };
    const DiskClaim& claim = disk_.claim();
    if (!claim.isStillWhole())
        return lost("the disk became shorter meanwhile");
    if (!claim.isStillInPlace())
        return lost("the disk was deleted, moved or replaced meanwhile");
    if (!claim.isEndReadable())
        return unreadable(claim.availableBytes() - 1);
    return asKernelSays(judgement, evidence);
}

Judgement VolumeRuns::judgeWithLog(RunEvidence evidence)
{
    const Judgement judgement = judge(evidence);
    const bool isLeftOut = tool_->logReading != nullptr && evidence.volume.log != 0 &&
                           judgement.verdict == Verdict::Inconclusive &&
                           !evidence.findings.lacksOtherDisk;
    if (!isLeftOut)
        return judgement;
    context_.log.step(Operation::Verify, {"Reading the log that waits to be replayed", {}, {}});
    // On the disk: its log is no other, and btrfs takes no file without a name (realpath(3)).
    const TrialDisk* const trial = std::exchange(trial_, nullptr);
    const auto first = runOn(Access::ReadOnly, ToolRun::Problems::Shown, {evidence.volume.log});
    const auto rest =
        first.findings.logParts.empty()
            ? first
            : runOn(Access::ReadOnly, ToolRun::Problems::Shown, first.findings.logParts);
    trial_ = trial;
    for (const RunEvidence& part : {first, rest})
        if (part.result.ending != Ending(Exited{0}))
            return judgement;
    if (first.findings.problems > 0 || rest.findings.problems > 0)
        return damaged(0, {"its log, which waits to be replayed, is damaged", {}, {}});
    evidence.volume.needsRecovery = false;
    return judge(evidence);
}

/// What a tool takes for damage may be a disk that cannot be read, which not every tool says.
Judgement VolumeRuns::asKernelSays(const Judgement& judgement, const RunEvidence& evidence) const
{
    if (trial_ != nullptr) {
        if (const auto byte = trial_->contents().firstUnreadable())
            return unreadable(byte);
        return trial_->contents().isOutOfRoom() ? outOfRoom() : judgement;
    }
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

std::optional<std::uint64_t> VolumeRuns::unreadableByte(const ReadFault& fault) const
{
    constexpr std::uint64_t around = 1U << 20U;
    const std::uint64_t available = disk_.claim().availableBytes();
    std::vector<ByteRange> pieces = endsOfVolume(available);
    const auto byte =
        fault.block ? productOrGreatest(*fault.block, volume_.blockBytes) : fault.byte;
    if (byte && *byte < available)
        pieces.insert(pieces.begin(), {*byte, std::min(around, available - *byte)});
    else if (fault.isUnproven)
        pieces.push_back({0, available});
    return firstUnreadable(pieces);
}

std::optional<std::uint64_t> VolumeRuns::firstUnreadable(const std::vector<ByteRange>& pieces) const
{
    const auto deadline = Clock::now() + std::chrono::seconds(30);
    return pellar::firstUnreadable(disk_.claim().descriptor(), disk_.claim().offset(), pieces, [&] {
        return context_.stop.isPressed() || Clock::now() > deadline;
    });
}

}  // namespace pellar
