// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/RepairApplication.h"

#include "contract/foundation/UTF8.h"
#include "contract/pellar/ErrorCodes.h"
#include "pellar/probe/DiskProbe.h"
#include "pellar/tools/Judging.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <numeric>
#include <system_error>
#include <utility>

namespace pellar {
namespace {

/// The disk as it was left by the trial.
class TriedRegion final : public RegionReader {
public:
    explicit TriedRegion(Overlay& overlay) : overlay_(overlay) {}

    std::uint64_t length() const override { return overlay_.bytes(); }
    int read(std::uint64_t place, std::span<std::uint8_t> bytes) override
    {
        return overlay_.read(place, bytes);
    }

private:
    Overlay& overlay_;
};

std::uint64_t lengthOf(const std::vector<ByteRange>& ranges)
{
    return std::accumulate(
        ranges.begin(), ranges.end(), std::uint64_t{0},
        [](std::uint64_t sum, const ByteRange& range) { return sum + range.length; });
}

bool isZero(ByteView bytes)
{
    return std::ranges::all_of(bytes, [](std::uint8_t byte) { return byte == 0; });
}

/// 0 or an errno. Where there is nothing but zeros the file has holes.
int copyInto(int file, Overlay& overlay, const std::function<bool()>& isStopped)
{
    Bytes buffer(1U << 20U);
    for (std::uint64_t at = 0; at < overlay.bytes(); at += buffer.size()) {
        const std::span part(buffer.data(), std::min<std::uint64_t>(buffer.size(),
                                                                    overlay.bytes() - at));
        if (isStopped())
            return ECANCELED;
        if (const int error = overlay.read(at, part))
            return error;
        const auto place = static_cast<off_t>(at);
        if (!isZero(part) &&
            ::pwrite(file, part.data(), part.size(), place) != static_cast<ssize_t>(part.size()))
            return errno != 0 ? errno : ENOSPC;
    }
    return ::ftruncate(file, static_cast<off_t>(overlay.bytes())) == 0 && ::fsync(file) == 0
               ? 0
               : errno;
}

// The shares of the progress, in per cent.
constexpr double keptAt = 85;

}  // namespace

RecordedDisk recordedDisk(const contract::DiskReference& reference, int descriptor,
                          ByteRange region)
{
    std::error_code error;
    const auto path = std::filesystem::canonical(reference.path, error);
    return {error ? reference.path : path,
            region.offset,
            region.length,
            readSuperblock(descriptor, region).uuid,
            reference.filesystem,
            reference.name};
}

RepairApplication::RepairApplication(JobContext& context, const JobDisk& disk,
                                     const TrialDisk& trial, const WriteMark& mark)
    : context_(context), disk_(disk), trial_(trial), mark_(mark)
{
}

UndoWork RepairApplication::work() const
{
    return {[this] { return context_.stop.isPressed(); },
            [this](std::uint64_t done, std::uint64_t total) {
                log_.progress(100.0 * static_cast<double>(done) /
                              static_cast<double>(std::max<std::uint64_t>(total, 1)));
            }};
}

Outcome RepairApplication::apply(Outcome tried)
{
    const auto ranges = trial_.overlay().differences();
    if (!ranges)
        return outcomeOfVerification(unreadable(trial_.overlay().firstUnreadable()));
    if (ranges->empty())
        return tried;
    if (!(WriteMark::of(disk_.claim().descriptor()) == mark_))
        return failedOutcome(
            contract::kPLErrorDiskChanged,
            {"another program wrote to it while the repair was tried; nothing was written", {}, {}});
    return write(*ranges, std::move(tried));
}

Outcome RepairApplication::write(const std::vector<ByteRange>& ranges, Outcome tried)
{
    const auto store = UndoStore::open(recordsIn(context_.options.trials));
    if (!store)
        return notWritten(store.error());
    log_.meter().setRange(keptAt, 100);
    log_.step(Operation::Repair, {"Keeping what the repair overwrites (%1$@ bytes in %2$@ places)",
                                  std::to_string(lengthOf(ranges)), std::to_string(ranges.size())});
    auto record = save(*store, ranges);
    if (!record)
        return notWritten(record.error());
    log_.step(Operation::Repair, {"Writing the proven repair to “%1$@”", log_.diskName(), {}});
    log_.flush();
    const DiskClaim& claim = disk_.claim();
    FileRegion region(claim.descriptor(), claim.offset(), claim.availableBytes());
    const auto applied = record->apply(region, work());
    if (!applied && applied.error().left == UndoFailure::Left::Unchanged)
        return notWritten(applied.error().sentence);
    if (!applied)
        return failedOutcome(contract::kPLErrorInterrupted, applied.error().sentence);
    keepWithinLimits(*store, record->id());
    return tried;
}

Result<UndoRecord, Sentence> RepairApplication::save(const UndoStore& store,
                                                     const std::vector<ByteRange>& ranges)
{
    const DiskClaim& claim = disk_.claim();
    FileRegion before(claim.descriptor(), claim.offset(), claim.availableBytes());
    TriedRegion after(trial_.overlay());
    const RecordedRepair repair{recordedDisk(disk_.reference(), claim.descriptor(),
                                             {claim.offset(), claim.availableBytes()}),
                                {Subject::Filesystem, Operation::Repair},
                                context_.options.trials.user,
                                std::chrono::system_clock::now()};
    return store.save(repair, ranges, before, after, work());
}

/// The user's stop comes before all other reasons.
Outcome RepairApplication::notWritten(const Sentence& reason) const
{
    if (context_.stop.isPressed())
        return outcomeOfVerification(stopped(0));
    return {Verdict::Damaged, contract::kPLErrorNotRepaired, 0, reason, {}};
}

void RepairApplication::keepWithinLimits(const UndoStore& store, const std::string& id)
{
    const Trials& trials = context_.options.trials;
    if (!context_.policy.keepsUndo) {
        if (const auto removed = store.remove(id); !removed)
            log_.remark(removed.error());
        return;
    }
    store.removeBeyond(trials.limits, std::chrono::system_clock::now());
    log_.advice(adviceFor(disk_.reference(), trials.howToUndo));
}

Outcome RepairApplication::preview(const Outcome& tried)
{
    const bool isProven = tried.verdict == Verdict::Sound || tried.verdict == Verdict::Repaired;
    if (!isProven && tried.verdict != Verdict::Damaged)
        return tried;
    const auto ranges = trial_.overlay().differences();
    if (!ranges)
        return outcomeOfVerification(unreadable(trial_.overlay().firstUnreadable()));
    log_.remark(Sentence{"The repair would change %1$@ bytes in %2$@ places.",
                         std::to_string(lengthOf(*ranges)), std::to_string(ranges->size())});
    tellLoss(tried);
    if (const auto failure = writeImage())
        return failedOutcome(contract::kPLErrorCannotOpen, *failure);
    if (!isProven)
        return {Verdict::Damaged,
                contract::kPLErrorNotProven,
                0,
                {"a repair was tried, and would leave damage; nothing was written", {}, {}},
                {}};
    if (ranges->empty())
        return tried;
    return {Verdict::Damaged,
            contract::kPLErrorDamaged,
            0,
            {"a repair was tried, and would make it sound; nothing was written", {}, {}},
            {}};
}

void RepairApplication::tellLoss(const Outcome& tried)
{
    for (const Sentence& warning : tried.warnings)
        log_.remark(Sentence{"After the repair: %1$@.", log_.text(warning), {}});
}

/// None when no image is wanted, or it is there.
std::optional<Sentence> RepairApplication::writeImage()
{
    const std::filesystem::path& path = context_.policy.keptImage;
    if (path.empty())
        return std::nullopt;
    const std::string shown = contract::printable(path.native());
    log_.step(Operation::Repair, {"Writing the repaired volume to %1$@", shown, {}});
    const FileDescriptor file(::open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0600));
    const int error = file ? copyInto(file.get(), trial_.overlay(), work().isStopped) : errno;
    if (error == 0) {
        log_.remark(Sentence{"The repaired volume is in %1$@.", shown, {}});
        return std::nullopt;
    }
    if (file)
        ::unlink(path.c_str());
    return Sentence{"the repaired volume could not be written to %1$@: %2$@", shown,
                    ::strerrordesc_np(error)};
}

}  // namespace pellar
