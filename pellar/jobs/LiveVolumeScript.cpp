// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/LiveVolumeScript.h"

#include "contract/foundation/UTF8.h"
#include "contract/pellar/MessageKeys.h"
#include "pellar/jobs/ToolRun.h"
#include "pellar/tools/Capability.h"
#include "pellar/tools/btrfs/BtrfsSuperblock.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <cerrno>
#include <cstring>
#include <utility>

namespace pellar {
namespace {

using namespace std::chrono_literals;

constexpr std::uint64_t anyBytes = ~std::uint64_t{0};

}  // namespace

LiveVolumeScript::LiveVolumeScript(contract::DiskReferencePointer disk, std::vector<Mount> mounts,
                                   JobContext context)
    : disk_(std::move(disk)), mounts_(std::move(mounts)), context_(std::move(context))
{
}

void LiveVolumeScript::run()
{
    log_.started();
    log_.outcomeOfVolume(verify(), Operation::Verify);
}

Outcome LiveVolumeScript::verify()
{
    const Capability capability =
        liveCapabilityFor(mounts_.front().filesystem, context_.options.toolPath);
    if (!capability.isGiven())
        return failedOutcome(capability.error, capability.reason);
    program_ = capability.program;
    if (auto obstacle = findVolume())
        return *std::move(obstacle);
    const Judgement judgement = scrub();
    tellFindings(judgement);
    return outcomeWithoutRepair(judgement);
}

std::optional<Outcome> LiveVolumeScript::findVolume()
{
    if (const int error = reachVolume())
        return failedOutcome(
            contract::kPLErrorCannotOpen,
            {"it is mounted, but could not be reached there: %1$@", ::strerrordesc_np(error), {}});
    if (volume_->scrubbedBytes())
        return failedOutcome(contract::kPLErrorToolFailed,
                             {"another program is checking it just now", {}, {}});
    return std::nullopt;
}

// An errno. Something else may be mounted over a place, so what is found there is compared with the
// disk.
int LiveVolumeScript::reachVolume()
{
    device_ = FileDescriptor(::open(disk_->path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
    if (!device_)
        return errno;
    const auto superblock = readBtrfsSuperblock(device_.get(), 0, anyBytes);
    int error = ENODEV;
    for (const Mount& place : mounts_) {
        auto opened = MountedBtrfs::open(place.target);
        if (!opened) {
            error = opened.error();
        } else if (superblock && opened->id() == superblock->id) {
            volume_.emplace(*std::move(opened));
            log_.trace("it is verified through " + contract::printable(place.target));
            return 0;
        }
    }
    return error;
}

Judgement LiveVolumeScript::scrub()
{
    const RunRequest run = request();
    log_.trace("run: " + shown(run.command));
    log_.step(Operation::Verify, {"Verifying “%1$@” while it stays mounted", log_.diskName(), {}});
    log_.flush();
    storedBytes_ = volume_->storedBytes();
    const RunResult result = runTool(run, context_.stop, *this);
    Judgement judgement = judgeScrub(result, report_, volume_->disks());
    if (judgement.verdict != Verdict::Stopped && !isStillThere())
        judgement = {Verdict::Failed,
                     contract::kPLErrorDiskChanged,
                     judgement.detail,
                     {"the disk became shorter or unreadable meanwhile", {}, {}},
                     false};
    return judgement;
}

// It gets time when the program is leaving, too: killed, an older kernel's scrub would go on, and
// its process with it.
RunRequest LiveVolumeScript::request() const
{
    RunRequest request;
    request.command = {program_, scrubArguments(diskArgumentOfTool())};
    request.disk = volume_->descriptor();
    request.limits = context_.options.outputLimits;
    request.graceTimes = graceTimesFor(Access::ReadWrite);
    request.longestTick = 500ms;
    return request;
}

/// NO when the device's name leads to no disk, or another one, or its beginning cannot be read.
bool LiveVolumeScript::isStillThere() const
{
    struct stat before = {};
    struct stat now = {};
    if (::fstat(device_.get(), &before) != 0 || ::stat(disk_->path.c_str(), &now) != 0 ||
        before.st_rdev != now.st_rdev)
        return false;
    const auto superblock = readBtrfsSuperblock(device_.get(), 0, anyBytes);
    return superblock && superblock->id == volume_->id();
}

void LiveVolumeScript::tellFindings(const Judgement& judgement)
{
    for (const Sentence& finding : scrubFindings(report_))
        log_.error(finding);
    const bool hasReadAll =
        judgement.verdict == Verdict::Sound || judgement.verdict == Verdict::Damaged;
    if (hasReadAll && report_.withoutChecksum > 0)
        log_.remark({"Blocks of files that have no checksum to be compared with: %1$@",
                     std::to_string(report_.withoutChecksum),
                     {}});
    if (judgement.verdict != Verdict::Sound)
        return;
    log_.remark(log_.text("Everything that has a checksum agrees with it, in every copy."));
    log_.remark(log_.text(
        "Whether the parts of the file system agree with each other shows only unmounted."));
}

void LiveVolumeScript::line(std::string_view line, bool)
{
    readScrubLine(line, report_);
    const std::string text = withDiskName(line, log_.diskName());
    if (line.starts_with("ERROR: "))
        log_.problem(text);
    else if (!line.empty())
        log_.detail(text);
}

void LiveVolumeScript::stopAsked()
{
    isStopping_ = true;
    volume_->cancelScrub();
}

void LiveVolumeScript::tick()
{
    if (isStopping_)  // the tool may have begun only after it was asked to end
        volume_->cancelScrub();
    const auto scrubbed = volume_->scrubbedBytes();
    if (scrubbed && storedBytes_ > 0)
        log_.progress(100.0 * static_cast<double>(*scrubbed) / static_cast<double>(storedBytes_));
    log_.flushIfDue();
}

}  // namespace pellar
