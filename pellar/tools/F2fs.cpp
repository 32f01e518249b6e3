// SPDX-License-Identifier: Apache-2.0
#include "pellar/bytes/Bytes.h"
#include "pellar/tools/Judging.h"
#include "pellar/tools/ToolOutput.h"
#include "pellar/tools/ToolTable.h"
#include "pellar/tools/VolumeFacts.h"

#include <array>

namespace pellar {
namespace {

/// What we read ourselves of an f2fs volume (Linux, include/linux/f2fs_fs.h; all fields
/// little-endian).
struct F2fsSuperblock {
    static constexpr std::size_t size = 512;

    std::uint64_t volumeBytes = 0;
    bool isBackup = false;
};

std::optional<F2fsSuperblock> parseF2fsSuperblock(ByteView bytes)
{
    constexpr std::uint64_t magicNumber = 0xF2F52010;
    if (bytes.size() < F2fsSuperblock::size || littleEndian(bytes, 0, 4) != magicNumber)
        return std::nullopt;
    const std::uint64_t blockShift = littleEndian(bytes, 16, 4);
    const std::uint64_t blocks = littleEndian(bytes, 36, 8);
    if (blockShift < 12 || blockShift > 16 || blocks == 0)
        return std::nullopt;
    F2fsSuperblock block;
    block.volumeBytes = productOrGreatest(blocks, std::uint64_t{1} << blockShift);
    return block;
}

/// The superblock in the first block of the volume that starts at `offset`, or its copy in the
/// second.
std::optional<F2fsSuperblock> readF2fsSuperblock(int descriptor, std::uint64_t offset,
                                                 std::uint64_t availableBytes)
{
    constexpr std::uint64_t primaryPlace = 1024;
    for (const std::uint64_t place : {primaryPlace, primaryPlace + 4096}) {
        if (availableBytes < place + F2fsSuperblock::size)
            break;
        const auto bytes = readDisk(descriptor, offset + place, F2fsSuperblock::size);
        auto block = bytes ? parseF2fsSuperblock(*bytes) : std::nullopt;
        if (block) {
            block->isBackup = place != primaryPlace;
            return block;
        }
    }
    return std::nullopt;
}

constexpr std::string_view name = "fsck.f2fs";

// f2fs-tools 1.15 and 1.16, fsck/fsck.c and fsck/mount.c.
constexpr std::array signs{
    DamageSign{"a valid F2FS superblock", Damage::Structure},
    DamageSign{"Magic Mismatch", Damage::Structure},
    DamageSign{"Can't find valid checkpoint", Damage::Structure},
    DamageSign{"Invalid CP CRC", Damage::Structure},
    DamageSign{"SIT", Damage::Bookkeeping},
    DamageSign{"curseg", Damage::Bookkeeping},
    DamageSign{"matching with CP", Damage::Bookkeeping},
    DamageSign{"matched with CP", Damage::Bookkeeping},
    DamageSign{"nreachable", Damage::LostPlaces},
};

bool tellsOfDamage(std::string_view line)
{
    return line.find("[ASSERT]") != std::string_view::npos ||
           line.find("[Fail]") != std::string_view::npos || line.starts_with("Magic Mismatch") ||
           line.find("Can't find ") != std::string_view::npos ||
           line.find("Invalid CP CRC") != std::string_view::npos || line.starts_with("NID[0x");
}

/// Reads what fsck.f2fs prints: what is wrong is marked "[ASSERT]", each part of the check ends
/// with "[Ok..]" or "[Fail]", and a full run with "Done: 0.000000 secs".
class F2fsOutput final : public LineOutput {
    ToolLine tell(std::string_view line) override
    {
        constexpr std::string_view state = "Info: checkpoint state = ";
        findings_.isComplete = findings_.isComplete || line.starts_with("Done: ");
        findings_.corrections += line.find("[FIX]") != std::string_view::npos ? 1 : 0;
        // Data that was written after the last checkpoint waits to be rolled forward.
        if (line.starts_with(state) && line.find(" unmount") == std::string_view::npos)
            findings_.skippedJournal = true;
        if (line.starts_with("[ASSERT]") && (line.find("dev_read") != std::string_view::npos ||
                                             line.find("read NAT bits") != std::string_view::npos))
            noteReadFault({std::nullopt, std::nullopt, true});
        if (!tellsOfDamage(line))
            return detail(line);
        const DamageSign* const sign = damageIn(signs, line);
        return problem(line, sign == nullptr ? Damage::Contents : sign->kind);
    }
};

// It gives up with 255, after having said why.
constexpr std::array damagedStatuses{1, 4, 255};

VolumeFacts examine(int disk, std::uint64_t offset, std::uint64_t availableBytes)
{
    const auto superblock = readF2fsSuperblock(disk, offset, availableBytes);
    VolumeFacts facts = factsFrom(superblock, "f2fs", disk, offset, availableBytes);
    facts.volumeBytes = superblock ? superblock->volumeBytes : 0;
    return facts;
}

// Without -f a volume that says of itself that all is well is believed.
std::vector<std::string> arguments(Access access, const std::string& disk, std::uint64_t)
{
    return {access == Access::ReadOnly ? "--dry-run" : "-y", "-f", disk};
}

// It ends with 0 where the first superblock was lost and the second was taken.
Judgement judge(const RunEvidence& evidence)
{
    return judgeRun(evidence, {name, damagedStatuses, [](int, const Findings& findings) {
                                   return findings.isComplete;
                               }});
}

}  // namespace

const Tool& fsckF2fs()
{
    static const Tool tool{
        .name = name,
        .repairName = name,
        .package = "f2fs-tools",
        .habits = {.logReplayedAs = "f2fs"},
        .version = {{"-V"}, "fsck.f2fs "},
        .examine = examine,
        .arguments = arguments,
        .makeReader = readerFor<F2fsOutput>,
        .judge = judge,
    };
    return tool;
}

}  // namespace pellar
