// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/PartitionMapScript.h"

#include "contract/foundation/Array.h"
#include "contract/foundation/UTF8.h"
#include "pellar/jobs/RecordedWriting.h"
#include "pellar/partitions/MapOutcome.h"

#include <algorithm>
#include <chrono>
#include <limits>
#include <span>
#include <thread>
#include <utility>

namespace pellar {
namespace {

contract::Value valueOf(const FindingArgument& argument)
{
    if (const auto* const text = std::get_if<std::string>(&argument))
        return std::string_view(*text);
    const std::uint64_t number = std::get<std::uint64_t>(argument);
    if (number > std::uint64_t{std::numeric_limits<std::int64_t>::max()})
        return std::to_string(number);
    return static_cast<std::int64_t>(number);
}

contract::Array parametersOf(const Finding& finding)
{
    const contract::Array parameters = contract::Array::make();
    for (const FindingArgument& argument : finding.arguments)
        parameters.append(valueOf(argument));
    return parameters;
}

Sentence reasonOf(contract::ErrorCode claimError)
{
    switch (claimError) {
        case contract::kPLErrorDiskInUse:
        case contract::kPLErrorCouldNotUnmount:
            return {"the disk, or a part of it, is mounted or in use", {}, {}};
        case contract::kPLErrorReadOnly: return {"the disk cannot be written", {}, {}};
        default: return {"the disk cannot be opened", {}, {}};
    }
}

/// Where the plan writes, in ascending order, each place once.
std::vector<ByteRange> rangesOf(const RepairPlan& plan, std::uint32_t sectorBytes)
{
    std::vector<ByteRange> ranges;
    for (const SectorWrite& write : plan.writes)
        ranges.push_back({write.first * sectorBytes, write.after.size()});
    std::ranges::sort(ranges, {}, &ByteRange::offset);
    std::vector<ByteRange> apart;
    for (const ByteRange& range : ranges)
        if (apart.empty() || apart.back().end() <= range.offset)
            apart.push_back(range);
        else
            apart.back().length = std::max(apart.back().end(), range.end()) - apart.back().offset;
    return apart;
}

/// The bytes of a disk as the plan leaves it.
class PlannedRegion final : public RegionReader {
public:
    PlannedRegion(Region& disk, const RepairPlan& plan, std::uint32_t sectorBytes)
        : disk_(disk), plan_(plan), sectorBytes_(sectorBytes)
    {
    }

    std::vector<ByteRange> ranges() const { return rangesOf(plan_, sectorBytes_); }
    std::uint64_t length() const override { return disk_.length(); }

    int read(std::uint64_t place, std::span<std::uint8_t> bytes) override
    {
        if (const int error = disk_.read(place, bytes))
            return error;
        for (const SectorWrite& write : plan_.writes) {
            const std::uint64_t start = write.first * sectorBytes_;
            const std::uint64_t from = std::max(place, start);
            const std::uint64_t end = std::min(place + bytes.size(), start + write.after.size());
            if (from < end)
                std::ranges::copy(ByteView(write.after).subspan(from - start, end - from),
                                  bytes.begin() + static_cast<std::ptrdiff_t>(from - place));
        }
        return 0;
    }

private:
    Region& disk_;
    const RepairPlan& plan_;
    const std::uint32_t sectorBytes_;
};

Outcome stopped()
{
    return {Verdict::Stopped, contract::kPLErrorCancelled, 0, {}, {}};
}

}  // namespace

PartitionMapScript::PartitionMapScript(contract::DiskReferencePointer disk, Operation operation,
                                       JobContext context)
    : disk_(std::move(disk)), operation_(operation), context_(std::move(context))
{
}

void PartitionMapScript::run()
{
    log_.started();
    report(carryOut());
}

// udev locks a device while it looks at it, as it does after every change (systemd's "Locking Block
// Device Access"). That is over in a moment; a mount is not.
Result<MapClaim, contract::ErrorCode> PartitionMapScript::claim() const
{
    constexpr std::chrono::milliseconds pause{50};
    constexpr int mostTries = 40;
    for (int tries = 1;; ++tries) {
        auto taken = MapClaim::take(*disk_, accessFor(operation_, context_.policy),
                                    context_.options.systemPaths);
        const bool isBusy = !taken && taken.error() == contract::kPLErrorDiskInUse;
        if (!isBusy || tries == mostTries || context_.stop.isPressed())
            return taken;
        std::this_thread::sleep_for(pause);
    }
}

// The claim ends here: the disk is given back before the end is told.
Outcome PartitionMapScript::carryOut()
{
    step({"Reading the partition map of “%1$@”", log_.diskName(), {}}, 5);
    const auto taken = claim();
    if (context_.stop.isPressed())
        return stopped();
    if (!taken)
        return failedOutcome(taken.error(), reasonOf(taken.error()));
    const auto& disk = *taken;
    const PartitionMap map = disk.readMap();
    const MapReport found = reportOn(map);
    tellMap(map);
    for (const Finding& finding : found.findings)
        tell(finding);
    if (operation_ == Operation::Repair && found.verdict == MapVerdict::Repairable &&
        !map.unreadableSector)
        return repair(disk, map, found);
    const Outcome outcome = outcomeOfMapVerification(map, found);
    return operation_ == Operation::Repair && outcome.verdict == Verdict::Damaged
               ? outcomeOfRefusedRepair(
                     {"only a person can decide what is right; nothing was written", {}, {}})
               : outcome;
}

// What the map will be is known before anything is written: by reading it through the plan.
Outcome PartitionMapScript::repair(const MapClaim& claim, const PartitionMap& map,
                                   const MapReport& report)
{
    const auto planned = planRepair(map, report, claim.sectors());
    if (!planned)
        return outcomeOfRefusedRepair(planned.error());
    const PartitionMap repaired = claim.readMap(*planned);
    const Outcome outcome = outcomeOfMapRepair(repaired, reportOn(repaired));
    for (const SectorWrite& write : planned->writes)
        step({write.what, {}, {}}, 50);
    if (context_.policy.isPreview)
        return preview(claim, *planned, outcome);
    if (outcome.verdict != Verdict::Repaired && !context_.policy.appliesUnproven)
        return outcomeOfRefusedRepair(
            {"a repair was tried, and would leave damage; nothing was written", {}, {}});
    if (context_.stop.isPressed())
        return stopped();
    return write(claim, *planned);
}

Outcome PartitionMapScript::preview(const MapClaim& claim, const RepairPlan& plan,
                                    const Outcome& planned)
{
    const std::vector<ByteRange> ranges = rangesOf(plan, claim.sectors().sectorBytes());
    log_.remark(changesOf(ranges));
    if (planned.verdict != Verdict::Repaired)
        return outcomeOfRefusedRepair(
            {"a repair was tried, and would leave damage; nothing was written", {}, {}});
    return {Verdict::Damaged,
            contract::kPLErrorMapDamaged,
            0,
            {"a repair was tried, and would make it sound; nothing was written", {}, {}},
            {}};
}

// Whatever has happened on the way, what can be read afterwards is the answer.
Outcome PartitionMapScript::write(const MapClaim& claim, const RepairPlan& plan)
{
    FileRegion disk(claim.descriptor(), claim.offset(), claim.length());
    PlannedRegion after(disk, plan, claim.sectors().sectorBytes());
    RecordedWriting writing(
        context_,
        {recordedDisk(*disk_, claim.descriptor(), {claim.offset(), claim.length()}),
         {Subject::PartitionMap, Operation::Repair},
         context_.options.trials.user,
         std::chrono::system_clock::now()},
        contract::kPLErrorMapNotRepaired);
    if (auto failure = writing.write(after.ranges(), disk, after))
        return *std::move(failure);
    step({"Verifying the repaired partition map of “%1$@”", log_.diskName(), {}}, 95);
    claim.sectors().forgetCached();
    const PartitionMap map = claim.readMap();
    const MapReport found = reportOn(map);
    for (const Finding& finding : found.findings)
        if (levelOf(finding.kind) != FindingLevel::Note)
            tell(finding);
    Outcome outcome = outcomeOfMapRepair(map, found);
    if (outcome.verdict == Verdict::Repaired && !claim.rereadPartitions())
        log_.remark(
            Sentence{"The system has not taken up the repaired map yet; it does when "
                     "the disk is connected again.",
                     {},
                     {}});
    return outcome;
}

void PartitionMapScript::tellMap(const PartitionMap& map)
{
    if (map.kind == PartitionMap::Kind::None)
        return;
    const GPTCopy* const valid = map.validCopy();
    const bool isGPT = map.kind == PartitionMap::Kind::GPT;
    const std::size_t count = !isGPT ? map.mbr.partitions.size()
                              : valid != nullptr
                                  ? usedEntries(valid->entries, valid->header.header).size()
                                  : 0;
    const std::string sector = std::to_string(map.sectorBytes);
    step(isGPT
             ? sentenceAbout(count, "GUID partition table, %1$@ partition, sectors of %2$@ bytes",
                             "GUID partition table, %1$@ partitions, sectors of %2$@ bytes", sector)
             : sentenceAbout(count, "MBR partition table, %1$@ partition, sectors of %2$@ bytes",
                             "MBR partition table, %1$@ partitions, sectors of %2$@ bytes", sector),
         30);
}

void PartitionMapScript::tell(const Finding& finding)
{
    const bool isNote = levelOf(finding.kind) == FindingLevel::Note;
    const std::string text = context_.texts.text(textOf(finding.kind));
    if (isNote)
        log_.remark(text, parametersOf(finding));
    else
        log_.error(text, parametersOf(finding));
}

void PartitionMapScript::step(Sentence sentence, double percent)
{
    log_.step(operation_, sentence);
    log_.progress(percent);
}

void PartitionMapScript::report(const Outcome& outcome)
{
    const Operation operation = context_.policy.isPreview ? Operation::Verify : operation_;
    const std::string message =
        mapMessageOf(outcome, operation, log_.diskName(), context_.texts).in(context_.texts);
    if (outcome.verdict == Verdict::Failed)
        log_.failure(asLine(message));
    else if (!outcome.reason.isEmpty())
        log_.remark(asLine(message));
    const Sentence line = mapVerdictLine(outcome.verdict, operation, log_.diskName());
    if (!line.isEmpty())
        log_.verdict(outcome.code == contract::kPLNoError, log_.text(line));
    log_.finished(outcome, message);
}

}  // namespace pellar
