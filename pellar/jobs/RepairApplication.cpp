// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/RepairApplication.h"

#include "contract/pellar/ErrorCodes.h"
#include "pellar/tools/Judging.h"

#include <chrono>
#include <utility>

namespace pellar {
namespace {

/// The disk as it was left by the trial.
class TriedRegion final : public RegionReader {
public:
    explicit TriedRegion(WorkingCopy& overlay) : overlay_(overlay) {}

    std::uint64_t length() const override { return overlay_.bytes(); }
    int read(std::uint64_t place, std::span<std::uint8_t> bytes) override
    {
        return overlay_.read(place, bytes);
    }

private:
    WorkingCopy& overlay_;
};

}  // namespace

Outcome applyTrial(const TrialDisk& trial, const WriteMark& mark, const JobDisk& disk,
                   JobContext& context, Outcome tried)
{
    const auto ranges = trial.contents().differences();
    if (!ranges)
        return outcomeOfVerification(unreadable(trial.contents().firstUnreadable()));
    if (ranges->empty())
        return tried.verdict == Verdict::Repaired ? outcomeOfVerification(sound(0)) : tried;
    if (!(WriteMark::of(disk.claim().descriptor()) == mark))
        return failedOutcome(
            contract::kPLErrorDiskChanged,
            {"another program wrote to it while the repair was tried; nothing was written",
             {},
             {}});
    const DiskClaim& claim = disk.claim();
    const ByteRange place{claim.offset(), claim.availableBytes()};
    FileRegion region(claim.descriptor(), place.offset, place.length);
    TriedRegion after(trial.contents());
    RecordedWriting writing(context,
                            {recordedDisk(disk.reference(), claim.descriptor(), place),
                             {Subject::Filesystem, Operation::Repair},
                             context.options.trials.user,
                             std::chrono::system_clock::now()},
                            contract::kPLErrorNotRepaired);
    const auto failure = writing.write(*ranges, region, after);
    return failure ? *failure : std::move(tried);
}

}  // namespace pellar
