// SPDX-License-Identifier: Apache-2.0
#include "pellar/probe/DiskProbe.h"
#include "pellar/process/ChildProcess.h"
#include "pellar/tools/Judging.h"
#include "pellar/tools/ToolTable.h"
#include "pellar/tools/ext/E2fsckOutput.h"
#include "pellar/tools/ext/ExtFiles.h"
#include "pellar/tools/ext/ExtSuperblock.h"

#include <charconv>

namespace pellar {
namespace {

constexpr std::string_view name = "e2fsck";

// The exit status is a sum of these (e2fsck(8), EXIT CODE).
constexpr int leftErrors = 4;
constexpr int operationalError = 8;
constexpr int usageError = 16;
constexpr int cancelledByUser = 32;
constexpr int libraryError = 128;
constexpr int knownBits =
    1 | 2 | leftErrors | operationalError | usageError | cancelledByUser | libraryError;

Judgement judgeStatus(int status, const RunEvidence& evidence)
{
    const Findings& found = evidence.findings;
    const Sentence statusReason{"%1$@ could not do its work (exit status %2$@)", "e2fsck",
                                std::to_string(status)};
    if ((status & cancelledByUser) != 0)
        return stopped(status);
    if (found.crashSignal != 0)
        return brokenOff(
            evidence, status,
            {"%1$@ crashed (signal %2$@)", "e2fsck", std::to_string(found.crashSignal)});
    if ((status & (usageError | libraryError)) != 0 || (status & ~knownBits) != 0)
        return brokenOff(evidence, status, statusReason);
    if (found.foundDiskInUse && (status & operationalError) != 0)
        return failed(status, {"the disk is in use", {}, {}}, contract::kPLErrorDiskInUse);
    // The file is shorter than the file system: no journal can make up for that.
    if (evidence.volume.isCutShort())
        return cutShort(status);
    if (found.lacksExternalJournal)
        return inconclusive(status,
                            {"its journal is kept on another disk, which was not found", {}, {}});
    // Changes that wait in the journal may be all that seems to be wrong; it is replayed first.
    if (evidence.access == Access::ReadOnly &&
        (found.skippedJournal || evidence.volume.needsRecovery))
        return inconclusive(
            status, {"its journal has not been replayed, which only a repair does", {}, {}});
    // Bits are added up. Known damage outranks an unfinished check: 12 means it gave up with
    // damage in sight.
    if ((status & leftErrors) != 0 || found.hasErrorsLeft)
        return damaged(status);
    if ((status & operationalError) != 0)
        return found.problems > 0 ? damaged(status) : failed(status, statusReason);
    return {Verdict::Sound, contract::kPLNoError, status, {}};
}

// Exit 0 alone says nothing: -n answers it after "Free blocks count wrong ... Fix? no", and output
// that stops early is no complete check.
Judgement judgeVerification(int status, const RunEvidence& evidence)
{
    Judgement judgement = judgeStatus(status, evidence);
    if (judgement.verdict != Verdict::Sound)
        return judgement;
    if (status != 0 || hasDamage(evidence))
        return damaged(status);
    if (!evidence.findings.isComplete)
        return inconclusive(status, {"%1$@ ended before it had checked everything", "e2fsck", {}});
    return judgement;
}

Judgement judgeRepair(int status, const RunEvidence& evidence)
{
    constexpr int corrected = 1 | 2;
    const Findings& found = evidence.findings;
    Judgement judgement = judgeStatus(status, evidence);
    judgement.madeProgress =
        (status & corrected) != 0 || found.wasModified || found.corrections > 0;
    return judgement;
}

VolumeFacts examine(int disk, std::uint64_t offset, std::uint64_t availableBytes)
{
    VolumeFacts facts;
    facts.availableBytes = availableBytes;
    const auto superblock = readExtSuperblock(disk, offset, availableBytes);
    facts.isRecognized = superblock && !superblock->isJournalDevice;
    facts.hasPrimary = superblock && !superblock->isBackup;
    facts.volumeBytes = superblock ? superblock->volumeBytes() : 0;
    facts.needsRecovery = facts.hasPrimary && superblock->needsRecovery;
    facts.blockBytes = superblock ? superblock->blockBytes : 0;
    if (superblock)
        facts.backups = superblock->backups(availableBytes);
    if (facts.hasPrimary && !superblock->needsRecovery)
        facts.files = countExtFiles(disk, offset, *superblock);
    if (!facts.hasPrimary && availableBytes > 0) {
        const Superblock signature = readSuperblock(disk, {offset, availableBytes});
        const bool isExt = signature.type.starts_with("ext") || signature.type.empty();
        facts.isForeign = signature.isAmbivalent || !isExt;
    }
    return facts;
}

std::vector<std::string> arguments(Access access, const std::string& disk, std::uint64_t offset)
{
    return {"-f", access == Access::ReadOnly ? "-n" : "-y", "-C",
            std::to_string(progressDescriptorOfTool),
            offset == 0 ? disk : disk + "?offset=" + std::to_string(offset)};
}

std::optional<double> percentOf(std::string_view progressLine)
{
    return e2fsckPercent(progressLine);
}

std::vector<std::string> listingArguments(const std::string& disk)
{
    return {"-R", "ls -p /lost+found", disk};
}

/// "/13/100644/0/0/#13/126824/": inode, mode, user, group, name, size. Of a directory and of what
/// is free, "/0/000000/0/0//0/", there is no size.
std::optional<CollectedFile> collectedFileIn(std::string_view line)
{
    constexpr int slashesBeforeName = 5;
    constexpr std::string_view regular = "100";
    std::size_t at = 0;
    std::size_t mode = 0;
    for (int i = 0; i < slashesBeforeName; ++i) {
        at = line.find('/', i == 0 ? 0 : at + 1);
        if (at == std::string_view::npos)
            return std::nullopt;
        mode = i == 1 ? at + 1 : mode;
    }
    const std::string_view rest = line.substr(at + 1);
    const std::size_t end = rest.size() > 1 ? rest.rfind('/', rest.size() - 2) : 0;
    if (!line.substr(mode).starts_with(regular) || !rest.ends_with('/') || end == 0 ||
        end == std::string_view::npos)
        return std::nullopt;
    CollectedFile file{std::string(rest.substr(0, end)), 0};
    const char* const number = rest.data() + end + 1;
    const bool isNumber =
        std::from_chars(number, rest.data() + rest.size(), file.bytes).ec == std::errc();
    return isNumber ? std::optional(file) : std::nullopt;
}

Judgement judge(const RunEvidence& evidence)
{
    if (const auto judgement = judgementOfEnding(evidence, name))
        return *judgement;
    const int status = std::get<Exited>(evidence.result.ending).status;
    return evidence.access == Access::ReadOnly ? judgeVerification(status, evidence)
                                               : judgeRepair(status, evidence);
}

}  // namespace

const Tool& e2fsck()
{
    static constexpr CollectedFilesReading collectedFiles{"debugfs", listingArguments,
                                                          collectedFileIn};
    static const Tool tool{
        .name = name,
        .repairName = name,
        .package = "e2fsprogs",
        .habits = {.takesOffset = true,
                   .wantsTerminal = false,
                   .replaysInRepair = true,
                   .endsInOrder = true,
                   .logReplayedAs = {}},
        .banner = "e2fsck ",
        .version = {{"-V"}, "e2fsck "},
        .examine = examine,
        .arguments = arguments,
        .makeReader = readerFor<E2fsckOutput>,
        .percentOf = percentOf,
        .judge = judge,
        .collectedFiles = &collectedFiles,
        .files = &extFiles(),
    };
    return tool;
}

}  // namespace pellar
