// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/Judging.h"
#include "pellar/tools/ToolOutput.h"
#include "pellar/tools/ToolTable.h"
#include "pellar/tools/VolumeFacts.h"
#include "pellar/tools/ntfs/NtfsVolume.h"

#include <array>
#include <charconv>
#include <cinttypes>
#include <cstdio>

namespace pellar {
namespace {

constexpr std::string_view name = "ntfsresize";
constexpr std::string_view repairName = "ntfsfix";

constexpr std::array phases{
    PhaseSign{"Checking filesystem consistency ...", "Checking files and directories"},
    PhaseSign{"Accounting clusters ...", "Checking which places are in use"},
    PhaseSign{"Processing $MFT and $MFTMirr...", "Comparing the file table with its copy"},
    PhaseSign{"Going to empty the journal", "Throwing the journal away"},
};

// ntfs-3g 2022.10.3, ntfsresize.c, ntfsfix.c and libntfs-3g.
constexpr std::array signs{
    DamageSign{"Cluster accounting failed", Damage::Bookkeeping},
    DamageSign{"cluster accounting mismatches", Damage::Bookkeeping},
    DamageSign{"NTFS signature is missing", Damage::Structure},
    DamageSign{"$MFTMirr does not match", Damage::Structure},
    DamageSign{"has no FILE magic", Damage::Structure},
    DamageSign{"ntfs_mst_post_read_fixup", Damage::Structure},
    DamageSign{"multiple referenced", Damage::SharedBlocks},
    DamageSign{"orrupt", Damage::Contents},
    DamageSign{"referenced outside", Damage::Contents},
    DamageSign{"Failed to ", Damage::Structure},
    DamageSign{"bad sector", Damage::Contents},
    DamageSign{"Comparing $MFTMirr to $MFT... FAILED", Damage::Structure},
};

/// "100.00 percent completed", which it writes over itself.
std::optional<double> percentIn(std::string_view line)
{
    constexpr std::string_view words = " percent completed";
    const std::size_t start = std::min(line.find_first_not_of(' '), line.size());
    line.remove_prefix(start);
    double percent = 0;
    const auto [end, error] = std::from_chars(line.data(), line.data() + line.size(), percent);
    const std::string_view rest(end, static_cast<std::size_t>(line.data() + line.size() - end));
    if (error != std::errc() || rest != words || percent < 0 || percent > 100)
        return std::nullopt;
    return percent;
}

/// Reads what ntfsresize -i and ntfsfix print. ntfsresize has found nothing wrong once it comes to
/// "Collecting resizing constraints ...".
class NtfsOutput final : public LineOutput {
    ToolLine tell(std::string_view line) override
    {
        if (const auto percent = percentIn(line))
            return progress(*percent);
        if (const PhaseSign* const sign = phaseIn(phases, line))
            return phase(line, sign->key);
        note(line);
        const DamageSign* const sign = damageIn(signs, line);
        return sign == nullptr ? detail(line) : problem(line, sign->kind);
    }

    void note(std::string_view line)
    {
        if (line.starts_with("Collecting resizing constraints"))
            findings_.isComplete = true;
        if (line.starts_with("Correcting differences in") ||
            line.starts_with("The boot sector has been rewritten") ||
            line == "Checking the alternate boot sector... FIXED")
            ++findings_.corrections;
        noteReading(std::string(line));
        if (line.find("NTFS is inconsistent") != std::string_view::npos)
            findings_.hasErrorsLeft = true;
        if (line.find("is hibernated") != std::string_view::npos ||
            line.find("unclean file system") != std::string_view::npos)
            findings_.skippedJournal = true;
    }

    // "Input/output error" by itself it also says of records that make no sense. The size of a file
    // it finds out by reading, and takes a bad place for the end.
    void noteReading(const std::string& line)
    {
        std::sscanf(line.c_str(), "Current device size: %" SCNu64 " bytes", &readableBytes_);
        if (line.ends_with("pread failed: Input/output error") ||
            line == "Error reading bootsector: Input/output error")
            noteReadFault({});
        else if (line.find("volume size is bigger than the device size") != std::string::npos)
            noteReadFault({readableBytes_, std::nullopt, true});
    }

    std::uint64_t readableBytes_ = 0;
};

constexpr std::array damagedStatuses{1};

const Sentence ownSystem{
    "only the system that it comes from can truly repair NTFS (there: chkdsk /f)", {}, {}};

/// A full volume cannot be made smaller, so ntfsresize ends with 1 where nothing is wrong.
int statusWithoutResizing(int status, const Findings& findings)
{
    return findings.isComplete && !findings.hasErrorsLeft && findings.problems == 0 ? 0 : status;
}

Judgement judgeNtfs(int status, const RunEvidence& evidence)
{
    RunEvidence checked = evidence;
    checked.volume.isMarkedDirty = checked.volume.needsRecovery = false;
    Judgement judgement = judgeVerification(statusWithoutResizing(status, evidence.findings),
                                            checked, {name, damagedStatuses});
    const bool isBackupAlone =
        evidence.volume.differsFromBackup && evidence.findings.problems == 0 && status == 0;
    if (judgement.code == contract::kPLErrorDamaged && !isBackupAlone)
        judgement.reason = ownSystem;
    // The mark, and a journal that goes with it, are for its own system to deal with: nothing here
    // knows what a check by that would find.
    if (judgement.verdict == Verdict::Sound && evidence.volume.isMarkedDirty)
        return inconclusive(
            status, {"it is marked to be checked by the system that it comes from; nothing else "
                     "was found",
                     {},
                     {}});
    if (judgement.verdict == Verdict::Sound && evidence.volume.needsRecovery)
        return inconclusive(
            status,
            {"its journal has not been replayed, which only the system that it comes from does",
             {},
             {}});
    return judgement;
}

VolumeFacts examine(int disk, std::uint64_t offset, std::uint64_t availableBytes)
{
    const auto sector = readNtfsBootSector(disk, offset, availableBytes);
    VolumeFacts facts = factsFrom(sector, "ntfs", disk, offset, availableBytes);
    facts.volumeBytes = sector ? sector->volumeBytes : 0;
    facts.differsFromBackup =
        facts.hasPrimary && !facts.isCutShort() && differsFromNtfsBackup(disk, offset, *sector);
    facts.isMarkedDirty = sector && isNtfsMarkedDirty(disk, offset, *sector).value_or(false);
    facts.needsRecovery = sector && hasNtfsJournalWaiting(disk, offset, *sector).value_or(false);
    return facts;
}

// -f, so that a volume that is marked to be checked is looked at all the same; -i never writes.
std::vector<std::string> arguments(Access access, const std::string& disk, std::uint64_t)
{
    if (access == Access::ReadWrite)
        return {disk};
    return {"-i", "-f", disk};
}

// ntfsfix answers 0 whatever it has found, so only what it says it has done counts for anything.
Judgement judge(const RunEvidence& evidence)
{
    const bool isRepair = evidence.access == Access::ReadWrite;
    if (auto judgement = judgementOfEnding(evidence, isRepair ? repairName : name))
        return *judgement;
    const int status = std::get<Exited>(evidence.result.ending).status;
    if (!isRepair)
        return judgeNtfs(status, evidence);
    Judgement judgement = damaged(status, ownSystem);
    judgement.madeProgress = evidence.findings.corrections > 0;
    return judgement;
}

}  // namespace

const Tool& ntfs()
{
    static const Tool tool{
        .name = name,
        .repairName = repairName,
        .package = "ntfs-3g",
        .banner = "ntfsresize v",
        .version = {{"--version"}, "ntfsresize v"},
        .examine = examine,
        .arguments = arguments,
        .makeReader = readerFor<NtfsOutput>,
        .judge = judge,
    };
    return tool;
}

}  // namespace pellar
