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

/// What we read ourselves of a FAT volume (ECMA-107 for FAT12 and FAT16, Microsoft's "FAT: General
/// Overview of On-Disk Format" for FAT32).
struct FatBootSector {
    static constexpr std::size_t size = 512;

    int bits = 0;  ///< 12, 16 or 32
    std::uint64_t volumeBytes = 0;
    bool isMarkedDirty = false;  ///< not properly unmounted
    bool isBackup = false;
};

/// The fields that FAT12, FAT16 and FAT32 share.
struct Geometry {
    std::uint64_t sectorBytes;
    std::uint64_t sectorsPerCluster;
    std::uint64_t reservedSectors;
    std::uint64_t tables;
    std::uint64_t rootEntries;
    std::uint64_t sectors;
    std::uint64_t sectorsPerTable;
    bool isLarge;  ///< the table's size stands where FAT32 has it

    std::uint64_t sectorsBeforeData() const
    {
        constexpr std::uint64_t entryBytes = 32;
        const std::uint64_t rootSectors =
            (rootEntries * entryBytes + sectorBytes - 1) / sectorBytes;
        return reservedSectors + tables * sectorsPerTable + rootSectors;
    }
    std::uint64_t clusters() const { return (sectors - sectorsBeforeData()) / sectorsPerCluster; }
};

Geometry geometryOf(ByteView bytes)
{
    const std::uint64_t smallSectors = littleEndian(bytes, 19, 2);
    const std::uint64_t smallTable = littleEndian(bytes, 22, 2);
    return {littleEndian(bytes, 11, 2),
            bytes[13],
            littleEndian(bytes, 14, 2),
            bytes[16],
            littleEndian(bytes, 17, 2),
            smallSectors != 0 ? smallSectors : littleEndian(bytes, 32, 4),
            smallTable != 0 ? smallTable : littleEndian(bytes, 36, 4),
            smallTable == 0};
}

bool makesSense(const Geometry& geometry)
{
    const bool hasSizes = isPowerOfTwo(geometry.sectorBytes) && geometry.sectorBytes >= 512 &&
                          geometry.sectorBytes <= 4096 && isPowerOfTwo(geometry.sectorsPerCluster);
    return hasSizes && geometry.reservedSectors > 0 && geometry.tables >= 1 &&
           geometry.tables <= 2 && geometry.sectorsPerTable > 0 &&
           (geometry.isLarge == (geometry.rootEntries == 0)) &&
           geometry.sectors > geometry.sectorsBeforeData();
}

bool hasSignature(ByteView bytes)
{
    const bool isJump = bytes[0] == 0xEB || bytes[0] == 0xE9;
    const bool isMedia = bytes[21] >= 0xF8 || bytes[21] == 0xF0;
    return isJump && isMedia && littleEndian(bytes, 510, 2) == 0xAA55;
}

// The number of clusters alone tells the kinds apart.
int bitsFor(const Geometry& geometry)
{
    constexpr std::uint64_t mostOf12 = 4084;
    if (geometry.isLarge)
        return 32;
    return geometry.clusters() <= mostOf12 ? 12 : 16;
}

/// None when the bytes are no boot sector of a FAT volume. It has no magic number of its own, so
/// every field that a volume cannot do without has to make sense.
std::optional<FatBootSector> parseFatBootSector(ByteView bytes)
{
    if (bytes.size() < FatBootSector::size || !hasSignature(bytes))
        return std::nullopt;
    const Geometry geometry = geometryOf(bytes);
    if (!makesSense(geometry))
        return std::nullopt;
    FatBootSector sector;
    sector.bits = bitsFor(geometry);
    sector.volumeBytes = geometry.sectors * geometry.sectorBytes;
    // Bit 0 of the byte behind the drive number.
    sector.isMarkedDirty = (bytes[sector.bits == 32 ? 0x41 : 0x25] & 1U) != 0;
    return sector;
}

/// The boot sector of the volume that starts at `offset`, or the backup that a FAT32 volume keeps
/// in its sector 6.
std::optional<FatBootSector> readFatBootSector(int descriptor, std::uint64_t offset,
                                               std::uint64_t availableBytes)
{
    constexpr std::uint64_t backupPlace = 6 * 512;
    if (availableBytes < backupPlace + FatBootSector::size)
        return std::nullopt;
    if (const auto bytes = readDisk(descriptor, offset, FatBootSector::size))
        if (const auto sector = parseFatBootSector(*bytes))
            return sector;
    const auto bytes = readDisk(descriptor, offset + backupPlace, FatBootSector::size);
    auto backup = bytes ? parseFatBootSector(*bytes) : std::nullopt;
    if (!backup || backup->bits != 32)
        return std::nullopt;
    backup->isBackup = true;
    return backup;
}

constexpr std::string_view name = "fsck.fat";

constexpr std::array phases{
    PhaseSign{"Checking we can access the last sector", "Checking the end of the volume"},
    PhaseSign{"Starting check/repair pass.", "Checking files and directories"},
    PhaseSign{"Checking for bad clusters.", "Checking for unreadable places"},
    PhaseSign{"Checking for unused clusters.", "Looking for lost parts of files"},
    PhaseSign{"Reclaiming unconnected clusters.", "Looking for lost parts of files"},
    PhaseSign{"Checking free cluster summary.", "Checking the count of free space"},
    PhaseSign{"Writing changes.", "Writing the corrections"},
};

// dosfstools 4.2, boot.c, fat.c and check.c. An uninitialised summary is no damage.
constexpr std::array signs{
    DamageSign{"Dirty bit is set.", Damage::Unfinished},
    DamageSign{"Free cluster summary wrong", Damage::Bookkeeping},
    DamageSign{"FATs differ", Damage::Structure},
    DamageSign{"FATs appear to be corrupt", Damage::Structure},
    DamageSign{"FAT is corrupt", Damage::Structure},
    DamageSign{"ogical sector size", Damage::Structure},
    DamageSign{"luster size is zero", Damage::Structure},
    DamageSign{"Root directory", Damage::Structure},
    DamageSign{"oot directory is", Damage::Structure},
    DamageSign{"Filesystem has ", Damage::Structure},
    DamageSign{"Reclaimed ", Damage::LostPlaces},
    DamageSign{"Orphaned long file name", Damage::LostPlaces},
    DamageSign{"out of range", Damage::Contents},
    DamageSign{"share", Damage::SharedBlocks},
    DamageSign{"and/or bad clusters", Damage::Contents},
    DamageSign{"Bad cluster", Damage::Contents},
    DamageSign{"Duplicate", Damage::Contents},
    DamageSign{"Unfinished long file name", Damage::Contents},
    DamageSign{"Wrong checksum", Damage::Contents},
};

constexpr std::array bootDetails{"Root directory start", "Data area starts", "First FAT starts"};

/// "Read 512 bytes at 16384:Input/output error", or less of it came: "Got 1024 bytes instead of
/// 4096 at 16384".
std::optional<ReadFault> readFaultIn(const std::string& line)
{
    std::uint64_t count = 0;
    std::uint64_t wanted = 0;
    std::uint64_t place = 0;
    if (std::sscanf(line.c_str(), "Read %" SCNu64 " bytes at %" SCNu64 ":", &wanted, &place) == 2)
        return ReadFault{place, std::nullopt, false};
    if (std::sscanf(line.c_str(), "Got %" SCNu64 " bytes instead of %" SCNu64 " at %" SCNu64,
                    &count, &wanted, &place) == 3)
        return ReadFault{place + count, std::nullopt, true};
    return std::nullopt;
}

/// "NAME: 2 files, 1/10211 clusters"
std::optional<std::uint64_t> filesIn(const std::string& tally)
{
    std::uint64_t files = 0;
    const std::size_t end = tally.find(": ");
    const bool isCount = end != std::string::npos &&
                         std::sscanf(tally.c_str() + end + 2, "%" SCNu64 " files", &files) == 1;
    return isCount ? std::optional(files) : std::nullopt;
}

/// "Reclaimed 12 unused clusters (24576 bytes) in 2 chains."
std::uint64_t reclaimedIn(const std::string& line)
{
    std::uint64_t chains = 0;
    const std::size_t start = line.find(") in ");
    if (line.starts_with("Reclaimed ") && start != std::string::npos)
        std::sscanf(line.c_str() + start, ") in %" SCNu64 " chain", &chains);
    return chains;
}

/// Reads what fsck.fat 4.2 -v prints. What is wrong with a file stands below its path:
///     /FILE.TXT
///       File size is 5000 bytes, cluster chain length is 2048 bytes.
///       Truncating file to 2048 bytes.
/// The last line of a full run is "NAME: 2 files, 1/10211 clusters".
class FatOutput final : public LineOutput {
    ToolLine tell(std::string_view line) override
    {
        const bool isBelowPath = wasPath_ && line.starts_with(' ');
        const bool isTally = line.starts_with("/proc/self/fd/") && line.ends_with(" clusters");
        noteSizes(line);
        wasPath_ = line.starts_with('/') && !isTally;
        findings_.isComplete = findings_.isComplete || isTally;
        if (isTally)
            findings_.files = filesIn(std::string(line));
        if (const auto fault = readFaultIn(std::string(line)))
            noteReadFault(*fault);
        findings_.reconnected += reclaimedIn(std::string(line));
        findings_.wasModified = findings_.wasModified || line == "*** Filesystem was changed ***";
        if (const PhaseSign* const sign = phaseIn(phases, line))
            return phase(line, sign->key);
        if (isBelowPath)
            return problem(line, damageBelowPath(line));
        const DamageSign* const sign = isBootDetail(line) ? nullptr : damageIn(signs, line);
        return sign == nullptr || line.starts_with(' ') || wasPath_ || isTally
                   ? detail(line)
                   : problem(line, sign->kind);
    }

    /// Of the file whose path stood in a line of its own before.
    void noteSizes(std::string_view line)
    {
        std::uint64_t bytes = 0;
        const std::string text(line);
        if (!line.starts_with(' ')) {
            file_ = {0, text, std::nullopt, std::nullopt};
        } else if (std::sscanf(text.c_str(), "  File size is %" SCNu64 " bytes,", &bytes) == 1) {
            file_.before = bytes;
        } else if (std::sscanf(text.c_str(), "  Truncating file to %" SCNu64 " bytes.", &bytes) ==
                       1 &&
                   file_.name.starts_with('/') && file_.before > bytes) {
            file_.after = bytes;
            noteChange(file_);
        }
    }

    static Damage damageBelowPath(std::string_view line)
    {
        const DamageSign* const sign = damageIn(signs, line);
        return sign == nullptr ? Damage::Contents : sign->kind;
    }

    static bool isBootDetail(std::string_view line)
    {
        for (const std::string_view start : bootDetails)
            if (line.starts_with(start))
                return true;
        return false;
    }

    bool wasPath_ = false;
    FileChange file_;  ///< that the last lines were about
};

constexpr std::array damagedStatuses{1};

VolumeFacts examine(int disk, std::uint64_t offset, std::uint64_t availableBytes)
{
    const auto sector = readFatBootSector(disk, offset, availableBytes);
    VolumeFacts facts = factsFrom(sector, "vfat", disk, offset, availableBytes);
    facts.volumeBytes = sector ? sector->volumeBytes : 0;
    facts.isMarkedDirty = sector && sector->isMarkedDirty;
    return facts;
}

// Without -w: what is to be changed is written at the end, all at once.
std::vector<std::string> arguments(Access access, const std::string& disk, std::uint64_t)
{
    return {access == Access::ReadOnly ? "-n" : "-a", "-v", disk};
}

// 1 is the answer to every sort of damage, but also to what is no FAT volume at all, where there is
// no last line (fsck.fat(8), EXIT STATUS).
Judgement judge(const RunEvidence& evidence)
{
    return judgeRun(evidence, {name, damagedStatuses, [](int, const Findings& findings) {
                                   return findings.wasModified;
                               }});
}

}  // namespace

const Tool& fsckFat()
{
    static const Tool tool{
        .name = name,
        .repairName = name,
        .package = "dosfstools",
        .habits = {.collectedOne =
                       "no damage is left; lost parts were made into %1$@ file (FSCK0000.REC)",
                   .collectedMany = "no damage is left; lost parts were made into %1$@ files "
                                    "(FSCK0000.REC and so on)"},
        .banner = "fsck.fat ",
        // It has no option for this, and says it before it finds that the device is none.
        .version = {{"-n", "/dev/null"}, "fsck.fat "},
        .examine = examine,
        .arguments = arguments,
        .makeReader = readerFor<FatOutput>,
        .judge = judge,
    };
    return tool;
}

}  // namespace pellar
