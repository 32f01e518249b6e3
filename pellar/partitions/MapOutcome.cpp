// SPDX-License-Identifier: Apache-2.0
#include "pellar/partitions/MapOutcome.h"

#include "contract/pellar/ErrorCodes.h"

#include <cerrno>

namespace pellar {
namespace {

std::string_view messageKey(Verdict verdict, bool isRepair)
{
    switch (verdict) {
        case Verdict::Sound: return "verified the partition map of “%1$@”: no damage was found";
        case Verdict::Repaired: return "repaired the partition map of “%1$@”: no damage is left";
        case Verdict::Stopped:
            return isRepair ? "stopped before the partition map of “%1$@” was repaired"
                            : "stopped while verifying the partition map of “%1$@”";
        case Verdict::Damaged:
            return isRepair ? "cannot repair the partition map of “%1$@”: %2$@"
                            : "verified the partition map of “%1$@”: damage was found; %2$@";
        case Verdict::Inconclusive:
        case Verdict::Failed: break;
    }
    return isRepair ? "cannot repair the partition map of “%1$@”: %2$@"
                    : "cannot verify the partition map of “%1$@”: %2$@";
}

Outcome unreadableMap(std::uint64_t sector)
{
    return {Verdict::Failed,
            contract::kPLErrorUnreadable,
            EIO,
            {"sector %1$@ cannot be read; copy the disk to another one first (ddrescue)",
             std::to_string(sector),
             {}},
            {}};
}

}  // namespace

Outcome outcomeOfMapVerification(const PartitionMap& map, const MapReport& report)
{
    // What cannot be read is neither damaged nor missing.
    if (map.unreadableSector)
        return unreadableMap(*map.unreadableSector);
    switch (report.verdict) {
        case MapVerdict::None:
            return failedOutcome(contract::kPLErrorNoPartitionMap,
                                 {"there is no partition map", {}, {}});
        case MapVerdict::Sound: return {Verdict::Sound, contract::kPLNoError, 0, {}, {}};
        case MapVerdict::Repairable:
            return {Verdict::Damaged,
                    contract::kPLErrorMapDamaged,
                    0,
                    {"a repair can restore it from the copy that is sound", {}, {}},
                    {}};
        case MapVerdict::NeedsPerson: break;
    }
    return {Verdict::Damaged,
            contract::kPLErrorMapNeedsPerson,
            0,
            {"only a person can decide what is right, so no repair will touch it", {}, {}},
            {}};
}

Outcome outcomeOfMapRepair(const PartitionMap& map, const MapReport& confirmation)
{
    Outcome outcome = outcomeOfMapVerification(map, confirmation);
    if (outcome.verdict == Verdict::Sound)
        outcome.verdict = Verdict::Repaired;
    else if (outcome.verdict == Verdict::Damaged)
        outcome = {Verdict::Damaged,
                   contract::kPLErrorMapNotRepaired,
                   0,
                   {"it was written, but is still damaged", {}, {}},
                   {}};
    return outcome;
}

Outcome outcomeOfRefusedRepair(Sentence reason)
{
    return {Verdict::Damaged, contract::kPLErrorMapNotRepaired, 0, std::move(reason), {}};
}

Sentence mapMessageOf(const Outcome& outcome, Operation operation, const std::string& diskName,
                      const Texts& texts)
{
    return {messageKey(outcome.verdict, operation == Operation::Repair), diskName,
            outcome.reason.in(texts)};
}

Sentence mapVerdictLine(Verdict verdict, Operation operation, const std::string& diskName)
{
    switch (verdict) {
        case Verdict::Sound: return {"The partition map of “%1$@” appears to be OK.", diskName, {}};
        case Verdict::Repaired:
            return {"The partition map of “%1$@” was repaired successfully.", diskName, {}};
        case Verdict::Damaged:
            if (operation == Operation::Repair)
                return {"The partition map of “%1$@” could not be repaired.", diskName, {}};
            return {"The partition map of “%1$@” is damaged.", diskName, {}};
        case Verdict::Inconclusive:
        case Verdict::Failed:
        case Verdict::Stopped: break;
    }
    return {};
}

}  // namespace pellar
