// SPDX-License-Identifier: Apache-2.0
#include "pellar/bytes/Bytes.h"
#include "pellar/tools/Judging.h"
#include "pellar/tools/ToolOutput.h"
#include "pellar/tools/ToolTable.h"
#include "pellar/tools/VolumeFacts.h"

#include <array>
#include <cinttypes>
#include <cstdio>

namespace pellar {
namespace {

/// What we read ourselves of an XFS volume (xfsprogs' "XFS Algorithms & Data Structures",
/// "Superblocks"; all fields big-endian).
struct XfsSuperblock {
    static constexpr std::size_t size = 512;

    std::uint64_t volumeBytes = 0;
    std::uint64_t groupBytes = 0;  ///< of an allocation group; each begins with a superblock
    bool hasExternalLog = false;
    bool hasRealtimePart = false;  ///< kept on another disk
    bool isBackup = false;
};

/// Where a second group may begin: a disk is divided into four (small ones into two), and no group
/// is greater than 1 TiB.
std::vector<std::uint64_t> backupPlaces(std::uint64_t availableBytes)
{
    constexpr std::uint64_t greatestGroup = 1ULL << 40U;
    std::vector<std::uint64_t> places{greatestGroup};
    for (const std::uint64_t blockBytes : {4096U, 1024U, 2048U, 65536U, 512U})
        for (const std::uint64_t groups : {4U, 2U, 16U, 32U}) {
            const std::uint64_t blocks = availableBytes / blockBytes;
            places.push_back((blocks + groups - 1) / groups * blockBytes);
        }
    return places;
}

std::optional<XfsSuperblock> parseXfsSuperblock(ByteView bytes)
{
    if (bytes.size() < XfsSuperblock::size || !holdsText(bytes, 0, "XFSB"))
        return std::nullopt;
    const std::uint64_t blockBytes = bigEndian(bytes, 4, 4);
    const std::uint64_t blocks = bigEndian(bytes, 8, 8);
    const std::uint64_t groupBlocks = bigEndian(bytes, 84, 4);
    if (!isPowerOfTwo(blockBytes) || blockBytes < 512 || blockBytes > 65536 || blocks == 0 ||
        groupBlocks == 0)
        return std::nullopt;
    XfsSuperblock block;
    block.volumeBytes = productOrGreatest(blocks, blockBytes);
    block.groupBytes = groupBlocks * blockBytes;
    block.hasRealtimePart = bigEndian(bytes, 16, 8) != 0;
    block.hasExternalLog = bigEndian(bytes, 48, 8) == 0;
    return block;
}

/// The superblock of the volume that starts at `offset`, or, where there is none, that of the
/// second allocation group at the places where mkfs.xfs(8) puts it on a single disk.
std::optional<XfsSuperblock> readXfsSuperblock(int descriptor, std::uint64_t offset,
                                               std::uint64_t availableBytes)
{
    if (availableBytes < XfsSuperblock::size)
        return std::nullopt;
    if (const auto bytes = readDisk(descriptor, offset, XfsSuperblock::size))
        if (const auto primary = parseXfsSuperblock(*bytes))
            return primary;
    for (const std::uint64_t place : backupPlaces(availableBytes)) {
        if (place == 0 || place >= availableBytes)
            continue;
        const auto bytes = readDisk(descriptor, offset + place, XfsSuperblock::size);
        auto backup = bytes ? parseXfsSuperblock(*bytes) : std::nullopt;
        if (backup && backup->groupBytes == place) {
            backup->isBackup = true;
            return backup;
        }
    }
    return std::nullopt;
}

constexpr std::string_view name = "xfs_repair";

constexpr std::array phases{
    PhaseSign{"Phase 1 - ", "Checking the superblock"},
    PhaseSign{"Phase 2 - ", "Checking the log and the maps of free space"},
    PhaseSign{"Phase 3 - ", "Checking inodes"},
    PhaseSign{"Phase 4 - ", "Checking for blocks that are claimed twice"},
    PhaseSign{"Phase 5 - ", "Rebuilding the maps of free space"},
    PhaseSign{"Phase 6 - ", "Checking directories"},
    PhaseSign{"Phase 7 - ", "Checking link counts"},
};

// Lines that tell of no damage (xfsprogs 6.1 and 6.13, repair/). Everything else does: xfs_repair
// has many hundreds of messages, and few for a sound volume.
constexpr std::array<std::string_view, 27> harmless{
    "        - ",
    "Cannot get host filesystem geometry",
    "Repair may fail if there is a sector size mismatch",
    "the image and the host filesystem",
    "No modify flag set",
    "done",
    "ignored because the -n option was used",
    "which may be resolved by first mounting",
    "be replayed.  Mount the filesystem",
    "re-running xfs_repair",
    "the -L option to destroy",
    "Note that destroying the log",
    "of the filesystem before doing this",
    "Note - ",
    "Please reset with mount",
    "attempting to find secondary superblock",
    ".",
    "found candidate secondary superblock",
    "verified secondary superblock",
    "writing modified primary superblock",
    "resetting ",
    "Maximum metadata LSN",
    "Format log to cycle",
    "clearing needsrepair flag",
    "sb root inode value",
    "Cannot proceed further in no_modify mode",
    "Exiting now.",
};

constexpr std::array signs{
    DamageSign{"uperblock", Damage::Structure},
    DamageSign{"sb_icount", Damage::Bookkeeping},
    DamageSign{"sb_ifree", Damage::Bookkeeping},
    DamageSign{"sb_fdblocks", Damage::Bookkeeping},
    DamageSign{"sb_frextents", Damage::Bookkeeping},
    DamageSign{"agf_freeblks", Damage::Bookkeeping},
    DamageSign{"agi_count", Damage::Bookkeeping},
    DamageSign{"nlinks", Damage::Bookkeeping},
    DamageSign{"imap claims", Damage::Bookkeeping},
    DamageSign{"disconnected", Damage::LostPlaces},
    DamageSign{"not in the inode allocation tree", Damage::LostPlaces},
    DamageSign{"claims duplicate", Damage::SharedBlocks},
    DamageSign{"duplicate extent", Damage::SharedBlocks},
    DamageSign{"multiply claimed", Damage::SharedBlocks},
    DamageSign{"agf", Damage::Structure},
    DamageSign{"agi", Damage::Structure},
    DamageSign{"agfl", Damage::Structure},
    DamageSign{"btree", Damage::Structure},
    DamageSign{"root inode", Damage::Structure},
    DamageSign{"realtime", Damage::Structure},
};

bool isHarmless(std::string_view line)
{
    for (const std::string_view start : harmless)
        if (start == "." ? line.find_first_not_of('.') == std::string_view::npos
                         : line.starts_with(start) || line.find(start) == 1)
            return true;
    return false;
}

/// Reads what xfs_repair prints. Dots of its search for a superblock run on into the next line:
/// ".found candidate secondary superblock...".
class XfsOutput final : public LineOutput {
    ToolLine tell(std::string_view line) override
    {
        if (const PhaseSign* const sign = phaseIn(phases, line))
            return phase(line, sign->key);
        if (note(line) || isHarmless(line))
            return detail(line);
        const DamageSign* const sign = damageIn(signs, line);
        return problem(line, sign == nullptr ? Damage::Contents : sign->kind);
    }

    /// "superblock read failed, offset 0, size 32768, ag 0, rval -1", "fatal error -- Input/output
    /// error", "xfs_repair: read failed: Input/output error"
    void noteReading(std::string_view line)
    {
        if (line.ends_with("Input/output error"))
            noteReadFault({});
        else if (line.starts_with("superblock read failed, ") || line.starts_with("can't read ") ||
                 line.starts_with("cannot read "))
            noteReadFault({std::nullopt, std::nullopt, true});
    }

    /// "disconnected inode 132, moving to lost+found", "cleared inode 133"
    void noteLosses(std::string_view line)
    {
        const bool isMoved =
            line.starts_with("disconnected ") && line.ends_with(", moving to lost+found");
        findings_.reconnected += isMoved ? 1 : 0;
        findings_.cleared += line.starts_with("cleared inode ") ? 1 : 0;
        noteGone(line);
    }

    /// "cleared inode 133", 'junking entry "name" in directory inode 128'
    void noteGone(std::string_view line)
    {
        constexpr std::string_view entry = "junking entry \"";
        const std::size_t end = line.rfind("\" in directory inode ");
        std::uint64_t inode = 0;
        if (std::sscanf(std::string(line).c_str(), "cleared inode %" SCNu64, &inode) == 1)
            noteChange({inode, {}, std::nullopt, std::nullopt});
        else if (line.starts_with(entry) && end != std::string_view::npos && end > entry.size())
            noteChange({0, std::string(line.substr(entry.size(), end - entry.size())), std::nullopt,
                        std::nullopt});
    }

    /// YES for a line that tells of the check and not of the volume.
    bool note(std::string_view line)
    {
        noteReading(line);
        noteLosses(line);
        const bool isEnd =
            line.starts_with("No modify flag set, skipping filesystem flush") || line == "done";
        const bool isLog =
            line.find("valuable metadata changes in a log") != std::string_view::npos;
        const bool isElsewhere = line.find("external log") != std::string_view::npos;
        findings_.isComplete = findings_.isComplete || isEnd;
        findings_.skippedJournal = findings_.skippedJournal || isLog;
        findings_.lacksExternalJournal = findings_.lacksExternalJournal || isElsewhere;
        findings_.foundDiskInUse =
            findings_.foundDiskInUse || line.find("contains a mounted") != std::string_view::npos;
        return isEnd || isLog || isElsewhere || findings_.foundDiskInUse ||
               line.starts_with("xfs_repair: ") || line.starts_with("fatal error -- ");
    }
};

constexpr std::array damagedStatuses{1};

VolumeFacts examine(int disk, std::uint64_t offset, std::uint64_t availableBytes)
{
    const auto superblock = readXfsSuperblock(disk, offset, availableBytes);
    VolumeFacts facts = factsFrom(superblock, "xfs", disk, offset, availableBytes);
    facts.volumeBytes = superblock ? superblock->volumeBytes : 0;
    return facts;
}

std::vector<std::string> arguments(Access access, const std::string& disk, std::uint64_t)
{
    if (access == Access::ReadWrite)
        return {disk};
    return {"-n", disk};
}

// A repair ends with 0 whatever it has done, with 1 when it could not go on, and with 2 when the
// log has to be replayed first (xfs_repair(8), EXIT STATUS).
Judgement judge(const RunEvidence& evidence)
{
    return judgeRun(evidence, {name, damagedStatuses, [](int status, const Findings&) {
                                   return status == 0;
                               }});
}

}  // namespace

const Tool& xfsRepair()
{
    static const Tool tool{
        .name = name,
        .repairName = name,
        .package = "xfsprogs",
        .habits = {.logReplayedAs = "xfs"},
        .version = {{"-V"}, "xfs_repair version "},
        .examine = examine,
        .arguments = arguments,
        .makeReader = readerFor<XfsOutput>,
        .judge = judge,
    };
    return tool;
}

}  // namespace pellar
