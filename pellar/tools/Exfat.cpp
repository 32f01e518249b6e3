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

/// What we read ourselves of an exFAT volume (Microsoft, "exFAT file system specification",
/// section 3).
struct ExfatBootSector {
    static constexpr std::size_t size = 512;

    std::uint64_t volumeBytes = 0;
    std::uint32_t sectorBytes = 0;
    bool isMarkedDirty = false;  ///< not properly unmounted
    bool isBackup = false;
};

std::optional<ExfatBootSector> parseExfatBootSector(ByteView bytes)
{
    constexpr std::uint64_t volumeDirty = 2;
    if (bytes.size() < ExfatBootSector::size || !holdsText(bytes, 3, "EXFAT   ") ||
        littleEndian(bytes, 510, 2) != 0xAA55)
        return std::nullopt;
    const unsigned sectorShift = bytes[108];
    const std::uint64_t sectors = littleEndian(bytes, 72, 8);
    if (sectorShift < 9 || sectorShift > 12 || sectors == 0)
        return std::nullopt;
    ExfatBootSector sector;
    sector.sectorBytes = 1U << sectorShift;
    sector.volumeBytes = productOrGreatest(sectors, sector.sectorBytes);
    sector.isMarkedDirty = (littleEndian(bytes, 106, 2) & volumeDirty) != 0;
    return sector;
}

/// The boot sector of the volume that starts at `offset`, or its backup in sector 12, for every
/// size that a sector may have.
std::optional<ExfatBootSector> readExfatBootSector(int descriptor, std::uint64_t offset,
                                                   std::uint64_t availableBytes)
{
    if (availableBytes < ExfatBootSector::size)
        return std::nullopt;
    if (const auto bytes = readDisk(descriptor, offset, ExfatBootSector::size))
        if (const auto sector = parseExfatBootSector(*bytes))
            return sector;
    for (const std::uint32_t sectorBytes : {512U, 1024U, 2048U, 4096U}) {
        const auto bytes =
            readDisk(descriptor, offset + 12ULL * sectorBytes, ExfatBootSector::size);
        auto backup = bytes ? parseExfatBootSector(*bytes) : std::nullopt;
        if (backup && backup->sectorBytes == sectorBytes) {
            backup->isBackup = true;
            return backup;
        }
    }
    return std::nullopt;
}

constexpr std::string_view name = "fsck.exfat";

// exfatprogs 1.2.0 and 1.2.9, fsck.c, repair.c and libexfat.c.
constexpr std::array signs{
    DamageSign{"boot region", Damage::Structure},
    DamageSign{"boot sector", Damage::Structure},
    DamageSign{"failed to read bitmap", Damage::Structure},
    DamageSign{"upcase table", Damage::Structure},
    DamageSign{"failed to verify root directory", Damage::Structure},
    DamageSign{"failed to read root directory", Damage::Structure},
    DamageSign{"bitmap", Damage::Bookkeeping},
    DamageSign{"lost cluster", Damage::LostPlaces},
    DamageSign{"shared by", Damage::SharedBlocks},
    DamageSign{"ERROR: ", Damage::Contents},
    DamageSign{"(y/N)? ", Damage::Contents},
};

/// Reads what fsck.exfat prints. A run ends with one of
///     /proc/self/fd/3: clean. directories 1, files 0
///     /proc/self/fd/3: corrupted. directories 1, files 0
/// and a problem with its question and answer:
///     ERROR: /: the checksum of a file is wrong at 0x203060. Delete (y/N)? n
class ExfatOutput final : public LineOutput {
    ToolLine tell(std::string_view line) override
    {
        if (line.starts_with("/proc/self/fd/"))
            return tally(line);
        if (line.starts_with("failed to read "))
            noteReadFault({std::nullopt, std::nullopt, true});
        const DamageSign* const sign = damageIn(signs, line);
        if (sign == nullptr)
            return detail(line);
        findings_.corrections += line.ends_with("? y") ? 1 : 0;
        if (auto change = sizeIn(std::string(line)); change && line.ends_with("? y"))
            noteChange(*std::move(change));
        return problem(line, sign->kind);
    }

    ToolLine tally(std::string_view line)
    {
        const bool isCorrupted = line.find(": corrupted. directories ") != std::string_view::npos;
        const bool isClean = line.find(": clean. directories ") != std::string_view::npos;
        findings_.hasErrorsLeft = findings_.hasErrorsLeft || isCorrupted;
        findings_.isComplete = findings_.isComplete || isCorrupted || isClean;
        if (findings_.isComplete)
            findings_.files = filesIn(std::string(line));
        return detail(line);
    }

    /// "ERROR: /A: less clusters are allocated. truncates to 4096 bytes at 0x1180. Truncate (y/N)?
    /// y" Where it says "more clusters are allocated", the file keeps its size.
    static std::optional<FileChange> sizeIn(const std::string& line)
    {
        constexpr std::string_view start = "ERROR: ";
        FileChange change{0, {}, std::nullopt, 0};
        for (const std::string_view said :
             {": less clusters are allocated. truncate",
              ": cluster is already allocated for the other file. truncate",
              ": BAD cluster. truncate", ": broken cluster chain. truncate"}) {
            const std::size_t at = line.rfind(said);
            const std::size_t number = line.find(" to ", at == std::string::npos ? at : at + 1);
            if (!line.starts_with(start) || number == std::string::npos ||
                std::sscanf(line.c_str() + number, " to %" SCNu64 " bytes", &*change.after) != 1)
                continue;
            change.name = line.substr(start.size(), at - start.size());
            return change;
        }
        return std::nullopt;
    }

    /// "NAME: clean. directories 1, files 0"
    static std::optional<std::uint64_t> filesIn(const std::string& tally)
    {
        std::uint64_t directories = 0;
        std::uint64_t files = 0;
        const std::size_t start = tally.rfind("directories ");
        const bool isCount =
            start != std::string::npos &&
            std::sscanf(tally.c_str() + start, "directories %" SCNu64 ", files %" SCNu64,
                        &directories, &files) == 2;
        return isCount ? std::optional(directories + files) : std::nullopt;
    }
};

constexpr std::array damagedStatuses{1, 4};

VolumeFacts examine(int disk, std::uint64_t offset, std::uint64_t availableBytes)
{
    const auto sector = readExfatBootSector(disk, offset, availableBytes);
    VolumeFacts facts = factsFrom(sector, "exfat", disk, offset, availableBytes);
    facts.volumeBytes = sector ? sector->volumeBytes : 0;
    facts.isMarkedDirty = sector && sector->isMarkedDirty;
    return facts;
}

std::vector<std::string> arguments(Access access, const std::string& disk, std::uint64_t)
{
    return {access == Access::ReadOnly ? "-n" : "-y", disk};
}

// It says "clean" and exits 4 where it could not read what the volume is built on, and takes no
// notice of the mark of a volume that was not properly unmounted, which a repair takes off.
Judgement judge(const RunEvidence& evidence)
{
    return judgeRun(evidence, {name, damagedStatuses, [](int status, const Findings& findings) {
                                   return findings.corrections > 0 || status == 0 || status == 1;
                               }});
}

}  // namespace

const Tool& fsckExfat()
{
    static const Tool tool{
        .name = name,
        .repairName = name,
        .package = "exfatprogs",
        .banner = "exfatprogs version : ",
        .version = {{"-V"}, "exfatprogs version : "},
        .examine = examine,
        .arguments = arguments,
        .makeReader = readerFor<ExfatOutput>,
        .judge = judge,
    };
    return tool;
}

}  // namespace pellar
