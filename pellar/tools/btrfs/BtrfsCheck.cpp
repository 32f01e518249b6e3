// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/Judging.h"
#include "pellar/tools/ToolOutput.h"
#include "pellar/tools/ToolTable.h"
#include "pellar/tools/VolumeFacts.h"
#include "pellar/tools/btrfs/BtrfsSuperblock.h"

#include <array>
#include <charconv>

namespace pellar {
namespace {

constexpr std::string_view name = "btrfs";

// "[3/7] checking free space tree": what stands behind the number.
constexpr std::array phases{
    PhaseSign{"checking root items", "Checking the roots of the trees"},
    PhaseSign{"checking extents", "Checking which places are in use"},
    PhaseSign{"checking free space", "Checking the maps of free space"},
    PhaseSign{"checking fs roots", "Checking files and directories"},
    PhaseSign{"checking only csums items", "Checking the list of checksums"},
    PhaseSign{"checking csums", "Checking the list of checksums"},
    PhaseSign{"checking root refs", "Checking subvolumes"},
    PhaseSign{"checking quota groups", "Checking quotas"},
};

// btrfs-progs 6.2 and 6.14, check/. What stands in a line's beginning.
constexpr std::array signs{
    DamageSign{"checksum verify failed", Damage::Structure},
    DamageSign{"parent transid verify failed", Damage::Structure},
    DamageSign{"Csum didn't match", Damage::Structure},
    DamageSign{"No valid Btrfs found", Damage::Structure},
    DamageSign{"bad tree block", Damage::Structure},
    DamageSign{"bad key order", Damage::Structure},
    DamageSign{"couldn't ", Damage::Structure},
    DamageSign{"Couldn't ", Damage::Structure},
    DamageSign{"hunk[", Damage::Structure},
    DamageSign{"ref mismatch on", Damage::Bookkeeping},
    DamageSign{"backpointer mismatch", Damage::Bookkeeping},
    DamageSign{"incorrect global backref count", Damage::Bookkeeping},
    DamageSign{"owner ref check failed", Damage::Bookkeeping},
    DamageSign{"block group", Damage::Bookkeeping},
    DamageSign{"free space", Damage::Bookkeeping},
    DamageSign{"errors found in", Damage::Contents},
    DamageSign{" errors ", Damage::Contents},
    DamageSign{"unresolved ref", Damage::LostPlaces},
    DamageSign{"There are no extents for csum range", Damage::Contents},
    DamageSign{"csum exists for", Damage::Contents},
};

/// Without the "[3/7] " before it.
std::string_view withoutNumber(std::string_view line)
{
    const std::size_t end = line.starts_with('[') ? line.find("] ") : std::string_view::npos;
    return end == std::string_view::npos ? line : line.substr(end + 2);
}

// Said of volumes on which no error is found: what they tell of is made anew by mounting.
constexpr std::array<std::string_view, 2> remarks{
    "cache and super generation don't match",
    "a difference in qgroup ",
};

bool isAboutQuotas(std::string_view remark)
{
    return remark.find("qgroup") != std::string_view::npos;
}

bool isRemark(std::string_view line)
{
    for (const std::string_view remark : remarks)
        if (line.find(remark) != std::string_view::npos)
            return true;
    return false;
}

/// Reads what btrfs check prints. A full run ends with "found N bytes used, no error found" or
/// "found N bytes used, error(s) found", and a tally.
class BtrfsOutput final : public LineOutput {
    ToolLine tell(std::string_view line) override
    {
        const PhaseSign* const step =
            line.starts_with('[') ? phaseIn(phases, withoutNumber(line)) : nullptr;
        if (step != nullptr)
            return phase(line, step->key);
        if (note(line))
            return detail(line);
        if (isRemark(line)) {
            findings_.expectsDifference = findings_.expectsDifference || isAboutQuotas(line);
            return detail(line);
        }
        if (line.starts_with("Error reading ") && line.ends_with(", -1"))
            noteReadFault({});
        const DamageSign* const sign = damageIn(signs, line);
        return sign == nullptr ? detail(line) : problem(line, sign->kind);
    }

    /// YES for a line that tells of the check and not of the volume.
    bool note(std::string_view line)
    {
        const bool isTally =
            line.starts_with("found ") && line.find(" bytes used, ") != std::string_view::npos;
        const bool isMissing =
            line.starts_with("warning, device ") && line.ends_with(" is missing");
        findings_.isComplete = findings_.isComplete || isTally;
        findings_.hasErrorsLeft =
            findings_.hasErrorsLeft || (isTally && line.ends_with("error(s) found"));
        findings_.lacksOtherDisk = findings_.lacksOtherDisk || isMissing;
        findings_.foundDiskInUse =
            findings_.foundDiskInUse || line.find("is currently mounted") != std::string_view::npos;
        return isTally || isMissing;
    }
};

/// Reads what btrfs inspect-internal dump-tree prints of a log's tree of trees, and of these. It
/// ends with 0 also where it could not read.
class BtrfsLogOutput final : public LineOutput {
    ToolLine tell(std::string_view line) override
    {
        noteLogPart(line);
        const bool isDamage = line.starts_with("checksum verify failed") ||
                              line.starts_with("parent transid verify failed") ||
                              line.starts_with("bad tree block") || line.starts_with("ERROR: ");
        return isDamage ? problem(line, Damage::Structure) : detail(line);
    }

    ///     "	item 0 key (TREE_LOG ROOT_ITEM 5) itemoff 15844 itemsize 439"
    ///     "		generation 8 root_dirid 0 bytenr 30736384 byte_limit 0 bytes_used 0"
    void noteLogPart(std::string_view line)
    {
        constexpr std::string_view sign = " bytenr ";
        const std::size_t at = line.find(sign);
        if (isLogItem_ && at != std::string_view::npos) {
            std::uint64_t part = 0;
            const char* const number = line.data() + at + sign.size();
            if (std::from_chars(number, line.data() + line.size(), part).ec == std::errc())
                findings_.logParts.push_back(part);
        }
        isLogItem_ = line.find("key (TREE_LOG ROOT_ITEM ") != std::string_view::npos;
    }

    bool isLogItem_ = false;  ///< the line before begins one
};

constexpr std::array damagedStatuses{1};

VolumeFacts examine(int disk, std::uint64_t offset, std::uint64_t availableBytes)
{
    const auto superblock = readBtrfsSuperblock(disk, offset, availableBytes);
    VolumeFacts facts = factsFrom(superblock, "btrfs", disk, offset, availableBytes);
    facts.volumeBytes = superblock ? superblock->diskBytes : 0;
    facts.log = facts.hasPrimary ? superblock->log : 0;
    facts.needsRecovery = facts.log != 0;
    return facts;
}

std::vector<std::string> arguments(Access access, const std::string& disk, std::uint64_t)
{
    // --force lets it begin without the ten seconds in which it warns.
    if (access == Access::ReadWrite)
        return {"check", "--repair", "--force", disk};
    return {"check", "--readonly", disk};
}

// The log is a tree of trees; each is read with all that is below it.
std::vector<std::string> logArguments(const std::vector<std::uint64_t>& parts,
                                      const std::string& disk)
{
    std::vector<std::string> arguments{"inspect-internal", "dump-tree", "--hide-names", "--follow"};
    for (const std::uint64_t part : parts)
        arguments.insert(arguments.end(), {"-b", std::to_string(part)});
    arguments.push_back(disk);
    return arguments;
}

// It ends with 0 where a copy of what is damaged was still good, and where a whole disk is missing;
// only its words tell. A repair ends with 0 when it has come to its end.
Judgement judge(const RunEvidence& evidence)
{
    const Findings& found = evidence.findings;
    RunEvidence weighed = evidence;
    // With 1 as well where it expects the quotas to differ, and says that there is no error.
    if (found.expectsDifference && found.isComplete && !hasDamage(evidence) &&
        evidence.result.ending == Ending(Exited{1}))
        weighed.result.ending = Exited{0};
    return judgeRun(weighed, {name, damagedStatuses, [](int status, const Findings&) {
                                  return status == 0;
                              }});
}

}  // namespace

const Tool& btrfsCheck()
{
    static constexpr LogReading logReading{logArguments, readerFor<BtrfsLogOutput>};
    static const Tool tool{
        .name = name,
        .repairName = name,
        .package = "btrfs-progs",
        .reasonAgainstDirectRepair =
            {"to repair btrfs is dangerous by its tool’s own manual; copy what matters to another "
             "volume and make this one anew",
             {},
             {}},
        .version = {{"--version"}, "btrfs-progs v"},
        .examine = examine,
        .arguments = arguments,
        .makeReader = readerFor<BtrfsOutput>,
        .judge = judge,
        .logReading = &logReading,
    };
    return tool;
}

}  // namespace pellar
