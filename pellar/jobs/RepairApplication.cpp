// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/RepairApplication.h"

#include "contract/foundation/UTF8.h"
#include "contract/pellar/ErrorCodes.h"
#include "pellar/tools/Judging.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
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

}  // namespace

RepairApplication::RepairApplication(JobContext& context, const JobDisk& disk,
                                     const TrialDisk& trial, const WriteMark& mark)
    : context_(context), disk_(disk), trial_(trial), mark_(mark)
{
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
    const DiskClaim& claim = disk_.claim();
    const ByteRange place{claim.offset(), claim.availableBytes()};
    FileRegion region(claim.descriptor(), place.offset, place.length);
    TriedRegion after(trial_.overlay());
    RecordedWriting writing(context_,
                            {recordedDisk(disk_.reference(), claim.descriptor(), place),
                             {Subject::Filesystem, Operation::Repair},
                             context_.options.trials.user,
                             std::chrono::system_clock::now()},
                            contract::kPLErrorNotRepaired);
    const auto failure = writing.write(*ranges, region, after);
    return failure ? *failure : std::move(tried);
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
    const int error = file ? copyInto(file.get(), trial_.overlay(), workOf(context_).isStopped) : errno;
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
