// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/PartitionMapScript.h"

#include "contract/foundation/Array.h"
#include "contract/foundation/UTF8.h"
#include "pellar/partitions/MapOutcome.h"
#include "pellar/partitions/SavedSectors.h"

#include <limits>
#include <system_error>
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
        auto taken = MapClaim::take(*disk_, accessFor(operation_), context_.options.systemPaths);
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

Outcome PartitionMapScript::repair(const MapClaim& claim, const PartitionMap& map,
                                   const MapReport& report)
{
    const auto planned = planRepair(map, report, claim.sectors());
    if (!planned)
        return outcomeOfRefusedRepair(planned.error());
    const auto& plan = *planned;
    Outcome outcome;
    if (!save(claim, plan, outcome))
        return outcome;
    if (context_.stop.isPressed())
        return stopped();
    outcome = write(claim, plan);
    if (outcome.verdict == Verdict::Repaired && !claim.rereadPartitions())
        log_.remark(
            Sentence{"The system has not taken up the repaired map yet; it does when "
                     "the disk is connected again.",
                     {},
                     {}});
    return outcome;
}

bool PartitionMapScript::save(const MapClaim& claim, const RepairPlan& plan, Outcome& outcome)
{
    const SavedDisk disk{disk_->path, claim.offset(), claim.sectors().sectorBytes(),
                         std::chrono::system_clock::now()};
    const auto saved = saveSectors(plan, disk, context_.options.savedSectorsDirectory);
    if (!saved) {
        outcome = outcomeOfRefusedRepair(saved.error());
        return false;
    }
    const std::string directory = contract::printable(saved->native());
    log_.remark(
        {"The sectors that are overwritten are kept in %1$@; the README.txt there tells how "
         "to put them back.",
         directory,
         {}});
    return true;
}

// Whatever has happened on the way, what can be read afterwards is the answer.
Outcome PartitionMapScript::write(const MapClaim& claim, const RepairPlan& plan)
{
    const FileSectors sectors = claim.sectors();
    for (const SectorWrite& write : plan.writes) {
        step({write.what, {}, {}}, 50);
        if (const int error = sectors.write(write.first, write.after))
            return outcomeOfRefusedRepair({"sector %1$@ cannot be written: %2$@",
                                           std::to_string(write.first),
                                           std::generic_category().message(error)});
    }
    step({"Verifying the repaired partition map of “%1$@”", log_.diskName(), {}}, 80);
    sectors.forgetCached();
    for (const SectorWrite& write : plan.writes)
        if (sectors.read(write.first, write.after.size() / sectors.sectorBytes()) != write.after)
            return outcomeOfRefusedRepair(
                {"sector %1$@ does not hold what was written", std::to_string(write.first), {}});
    const PartitionMap map = claim.readMap();
    const MapReport found = reportOn(map);
    for (const Finding& finding : found.findings)
        if (levelOf(finding.kind) != FindingLevel::Note)
            tell(finding);
    return outcomeOfMapRepair(map, found);
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
    const std::string message =
        mapMessageOf(outcome, operation_, log_.diskName(), context_.texts).in(context_.texts);
    if (outcome.verdict == Verdict::Failed)
        log_.failure(message);
    else if (!outcome.reason.isEmpty())
        log_.remark(message);
    const Sentence line = mapVerdictLine(outcome.verdict, operation_, log_.diskName());
    if (!line.isEmpty())
        log_.verdict(outcome.code == contract::kPLNoError, log_.text(line));
    log_.finished(outcome, message);
}

}  // namespace pellar
