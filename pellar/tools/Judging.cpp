// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/Judging.h"

#include "contract/pellar/ErrorCodes.h"
#include "pellar/bytes/Bytes.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <string>

namespace pellar {
namespace {

/// Ended by us for printing without end, or for silence: what it had found by then stands.
Judgement judgementOfEnded(const RunEvidence& evidence, std::string_view tool)
{
    const bool wasSilent = evidence.result.cause == StopCause::Silence;
    const Sentence reason{wasSilent ? "%1$@ gave no sign of life and was ended"
                                    : "%1$@ printed without end and was ended",
                          std::string(tool),
                          {}};
    if (hasDamage(evidence))
        return damaged(0, reason);
    return failed(0, reason, contract::kPLErrorToolMisbehaved);
}

bool hasFindings(const RunEvidence& evidence)
{
    return evidence.findings.problems > 0 || evidence.findings.hasErrorsLeft;
}

/// What was named before the tool broke off is damage, unless a log that waits may put it right.
bool hasSeenDamage(const RunEvidence& evidence)
{
    return evidence.access == Access::ReadOnly && hasDamage(evidence) &&
           !evidence.findings.skippedJournal && !evidence.volume.needsRecovery;
}

/// What the tool could not read because of the disk.
std::optional<Judgement> judgementOfReading(const RunEvidence& evidence)
{
    const auto& fault = evidence.findings.readFault;
    if (!fault || fault->isUnproven)
        return std::nullopt;
    if (fault->block && evidence.volume.blockBytes > 0)
        return unreadable(productOrGreatest(*fault->block, evidence.volume.blockBytes));
    return unreadable(fault->byte);
}

/// Why nothing that the tool says can decide; none when it can.
std::optional<Sentence> obstacle(const RunEvidence& evidence)
{
    if (evidence.findings.lacksOtherDisk)
        return Sentence{"a part of it is on another disk, which was not found", {}, {}};
    if (evidence.findings.lacksExternalJournal)
        return Sentence{"its journal is kept on another disk, which was not found", {}, {}};
    if (evidence.findings.skippedJournal || evidence.volume.needsRecovery)
        return Sentence{"its log has not been replayed, which mounting it does", {}, {}};
    return std::nullopt;
}

}  // namespace

Judgement sound(std::int32_t detail)
{
    return {Verdict::Sound, contract::kPLNoError, detail, {}};
}

Judgement damaged(std::int32_t detail, Sentence reason)
{
    return {Verdict::Damaged, contract::kPLErrorDamaged, detail, std::move(reason)};
}

Judgement cutShort(std::int32_t detail)
{
    return {Verdict::Damaged,
            contract::kPLErrorCutShort,
            detail,
            {"its end is missing, and a repair would throw away what lies there", {}, {}}};
}

Judgement inconclusive(std::int32_t detail, Sentence reason)
{
    return {Verdict::Inconclusive, contract::kPLErrorInconclusive, detail, std::move(reason)};
}

Judgement stopped(std::int32_t detail)
{
    return {Verdict::Stopped, contract::kPLErrorCancelled, detail, {}};
}

Judgement failed(std::int32_t detail, Sentence reason, contract::ErrorCode code)
{
    return {Verdict::Failed, code, detail, std::move(reason)};
}

Judgement unreadable(std::optional<std::uint64_t> byte)
{
    const Sentence reason =
        byte ? Sentence{"the disk cannot be read at byte %1$@ of the volume; copy it to another "
                        "disk first (ddrescue)",
                        std::to_string(*byte),
                        {}}
             : Sentence{"the disk cannot be read in places; copy it to another disk first "
                        "(ddrescue)",
                        {},
                        {}};
    return failed(EIO, reason, contract::kPLErrorUnreadable);
}

Judgement brokenOff(const RunEvidence& evidence, std::int32_t detail, Sentence reason)
{
    if (evidence.volume.isCutShort())
        return cutShort(detail);
    return hasSeenDamage(evidence) ? damaged(detail, std::move(reason))
                                   : failed(detail, std::move(reason));
}

bool hasDamage(const RunEvidence& evidence)
{
    return hasFindings(evidence) || evidence.volume.isCutShort() ||
           evidence.volume.differsFromBackup;
}

std::optional<Judgement> judgementOfEnding(const RunEvidence& evidence, std::string_view tool)
{
    const Ending& ending = evidence.result.ending;
    auto ofReading = judgementOfReading(evidence);
    // A repair that met an unreadable place is ended by us, as if by the user.
    if (evidence.result.cause == StopCause::User &&
        (!ofReading || evidence.access == Access::ReadOnly))
        return stopped(0);
    if (const auto* const notStarted = std::get_if<NotStarted>(&ending))
        return failed(notStarted->error, {"%1$@ could not be started: %2$@", std::string(tool),
                                          ::strerrordesc_np(notStarted->error)});
    if (ofReading)
        return ofReading;
    if (evidence.result.cause != StopCause::None)
        return judgementOfEnded(evidence, tool);
    if (const auto* const killed = std::get_if<Killed>(&ending))
        return brokenOff(
            evidence, killed->signal,
            {"%1$@ was killed (signal %2$@)", std::string(tool), std::to_string(killed->signal)});
    return std::nullopt;
}

Judgement judgeRun(const RunEvidence& evidence, const ExitMeanings& meanings)
{
    if (auto judgement = judgementOfEnding(evidence, meanings.tool))
        return *judgement;
    const int status = std::get<Exited>(evidence.result.ending).status;
    Judgement judgement = judgeVerification(status, evidence, meanings);
    judgement.madeProgress = evidence.access == Access::ReadWrite &&
                             meanings.madeProgress != nullptr &&
                             meanings.madeProgress(status, evidence.findings);
    return judgement;
}

Judgement judgeVerification(int status, const RunEvidence& evidence, const ExitMeanings& meanings)
{
    const std::string tool(meanings.tool);
    const VolumeFacts& volume = evidence.volume;
    const bool saysDamaged = std::ranges::find(meanings.damaged, status) != meanings.damaged.end();
    if (evidence.findings.foundDiskInUse && status != 0)
        return failed(status, {"the disk is in use", {}, {}}, contract::kPLErrorDiskInUse);
    if (volume.isCutShort())  // no log can make up for what is not there
        return cutShort(status);
    if (const auto reason = obstacle(evidence))
        return inconclusive(status, *reason);
    if (!volume.hasPrimary)
        return damaged(status, {"its first superblock is lost; a copy of it was found", {}, {}});
    if (volume.differsFromBackup && !hasFindings(evidence))
        return damaged(status, {"its boot sector and the backup of it differ", {}, {}});
    if (hasDamage(evidence) || (saysDamaged && evidence.findings.isComplete))
        return damaged(status);
    if (status != 0)
        return failed(status, {"%1$@ could not do its work (exit status %2$@)", tool,
                               std::to_string(status)});
    if (!evidence.findings.isComplete)
        return inconclusive(status, {"%1$@ ended before it had checked everything", tool, {}});
    if (volume.isMarkedDirty)
        return damaged(status, {"it was not properly unmounted; nothing else was found", {}, {}});
    return sound(status);
}

}  // namespace pellar
