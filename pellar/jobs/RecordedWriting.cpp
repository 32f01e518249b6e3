// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/RecordedWriting.h"

#include "contract/pellar/ErrorCodes.h"
#include "pellar/probe/DiskProbe.h"

#include <algorithm>
#include <chrono>
#include <numeric>
#include <system_error>

namespace pellar {
namespace {

/// Where the share of this in the job's progress begins, in per cent.
constexpr double writingBegins = 85;

std::uint64_t lengthOf(const std::vector<ByteRange>& ranges)
{
    return std::accumulate(
        ranges.begin(), ranges.end(), std::uint64_t{0},
        [](std::uint64_t sum, const ByteRange& range) { return sum + range.length; });
}

}  // namespace

RecordedDisk recordedDisk(const contract::DiskReference& reference, int descriptor,
                          ByteRange region)
{
    std::error_code error;
    const auto path = std::filesystem::canonical(reference.path, error);
    return {error ? reference.path : path,           region.offset,        region.length,
            readSuperblock(descriptor, region).uuid, reference.filesystem, reference.name};
}

Sentence changesOf(const std::vector<ByteRange>& ranges)
{
    return sentenceAbout(ranges.size(), "The repair would change %1$@ place (%2$@ bytes).",
                         "The repair would change %1$@ places (%2$@ bytes).",
                         std::to_string(lengthOf(ranges)));
}

UndoWork workOf(JobContext& context)
{
    return {[&context] { return context.stop.isPressed(); },
            [&context](std::uint64_t done, std::uint64_t total) {
                context.log.progress(100.0 * static_cast<double>(done) /
                                     static_cast<double>(std::max<std::uint64_t>(total, 1)));
            }};
}

std::optional<Outcome> RecordedWriting::write(const std::vector<ByteRange>& ranges, Region& disk,
                                              RegionReader& after)
{
    JobLog& log = context_.log;
    const auto store = openRecords(context_.options.trials);
    if (!store)
        return notWritten(store.error());
    log.meter().setRange(writingBegins, 100);
    log.step(
        Operation::Repair,
        sentenceAbout(ranges.size(), "Keeping what the repair overwrites: %1$@ place (%2$@ bytes)",
                      "Keeping what the repair overwrites: %1$@ places (%2$@ bytes)",
                      std::to_string(lengthOf(ranges))));
    auto record = store->save(repair_, ranges, disk, after, workOf(context_));
    if (!record)
        return notWritten(record.error());
    log.step(Operation::Repair, {"Writing the proven repair to “%1$@”", log.diskName(), {}});
    log.flush();
    const std::string id = record->id();
    if (auto failure = apply(*std::move(record), disk))
        return failure;
    keepWithinLimits(*store, id);
    return std::nullopt;
}

/// The record is not in use any more when this answers.
std::optional<Outcome> RecordedWriting::apply(UndoRecord record, Region& disk) const
{
    const auto applied = record.apply(disk, workOf(context_));
    if (applied)
        return std::nullopt;
    return applied.error().left == UndoFailure::Left::Unchanged
               ? notWritten(applied.error().sentence)
               : failedOutcome(contract::kPLErrorInterrupted, applied.error().sentence);
}

/// The user's stop comes before all other reasons.
Outcome RecordedWriting::notWritten(const Sentence& reason) const
{
    if (context_.stop.isPressed())
        return {Verdict::Stopped, contract::kPLErrorCancelled, 0, {}, {}};
    return {Verdict::Damaged, notWritten_, 0, reason, {}};
}

void RecordedWriting::keepWithinLimits(const UndoStore& store, const std::string& id)
{
    const Trials& trials = context_.options.trials;
    if (!context_.policy.keepsUndo) {
        if (const auto removed = store.remove(id); !removed)
            context_.log.remark(removed.error());
        return;
    }
    store.removeBeyond(trials.limits(), std::chrono::system_clock::now());
    context_.advise(trials.howToUndo);
}

}  // namespace pellar
