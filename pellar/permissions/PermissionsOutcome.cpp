// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/PermissionsOutcome.h"

#include "contract/pellar/ErrorCodes.h"

namespace pellar {
namespace {

const Sentence incomplete{"not all files could be compared; none of the others differs", {}, {}};

std::string_view messageKey(const Outcome& outcome, Operation operation)
{
    const bool isRepair = operation == Operation::Repair;
    const bool hasFailed = outcome.code != contract::kPLNoError;
    if (outcome.verdict == Verdict::Stopped)
        return isRepair ? "stopped while repairing the permissions on “%1$@”"
                        : "stopped while verifying the permissions on “%1$@”";
    if (hasFailed)
        return isRepair ? "cannot repair the permissions on “%1$@”: %2$@"
                        : "cannot verify the permissions on “%1$@”: %2$@";
    if (outcome.verdict == Verdict::Repaired)
        return "repaired the permissions on “%1$@”: %2$@";
    return outcome.verdict == Verdict::Sound ? "verified the permissions on “%1$@”: none differ"
                                             : "verified the permissions on “%1$@”: %2$@";
}

Outcome nothingCompared()
{
    return {Verdict::Inconclusive,
            contract::kPLErrorNoReferences,
            0,
            {"it is not known here what permissions the packages give their files", {}, {}}};
}

Outcome withoutDifferences(const Tally& tally)
{
    const Verdict verdict = verdictOf(tally);
    return {verdict, contract::kPLNoError, 0,
            verdict == Verdict::Inconclusive ? incomplete : Sentence{}};
}

}  // namespace

void Tally::count(Unseen unseen)
{
    switch (unseen) {
        case Unseen::Missing: ++missing; break;
        case Unseen::ElsewhereMounted: ++elsewhere; break;
        case Unseen::BehindLink:
        case Unseen::Unreadable: ++unreachable; break;
    }
}

std::vector<Sentence> sentencesOf(const Tally& tally)
{
    std::vector<Sentence> sentences{sentenceAbout(
        tally.compared, "%1$@ file was compared with what its package says. Different: %2$@.",
        "%1$@ files were compared with what their packages say. Different: %2$@.",
        std::to_string(tally.differing))};
    const auto add = [&sentences](std::uint64_t count, std::string_view one,
                                  std::string_view many) {
        if (count > 0)
            sentences.push_back(sentenceAbout(count, one, many));
    };
    add(tally.withoutSource,
        "%1$@ file was not compared: it is not known here what permissions its package gives it.",
        "%1$@ files were not compared: it is not known here what permissions their packages give "
        "them.");
    add(tally.packagesBeyondBounds,
        "%1$@ package was not compared: it is larger than any package may be.",
        "%1$@ packages were not compared: they are larger than any package may be.");
    add(tally.foreign,
        "%1$@ file may not lend the rights of others: its content is not known to be its "
        "package's.",
        "%1$@ files may not lend the rights of others: their content is not known to be their "
        "packages'.");
    add(tally.undecided,
        "%1$@ file is undecided: the system may rightly have changed it after its installation.",
        "%1$@ files are undecided: the system may rightly have changed them after their "
        "installation.");
    add(tally.unreachable, "%1$@ file could not be reached.", "%1$@ files could not be reached.");
    add(tally.elsewhere, "%1$@ file is on another volume.", "%1$@ files are on another volume.");
    return sentences;
}

Verdict verdictOf(const Tally& tally)
{
    if (tally.differing > 0)
        return Verdict::Damaged;
    const bool isComplete =
        tally.compared > 0 && tally.withoutSource == 0 && tally.unreachable == 0;
    return isComplete ? Verdict::Sound : Verdict::Inconclusive;
}

Outcome outcomeOfPermissionsVerification(const Tally& tally)
{
    if (tally.compared == 0)
        return nothingCompared();
    if (tally.differing > 0)
        return {Verdict::Damaged, contract::kPLNoError, 0,
                sentenceAbout(tally.differing, "those of %1$@ file differ",
                              "those of %1$@ files differ")};
    return withoutDifferences(tally);
}

Outcome outcomeOfPermissionsRepair(const Tally& afterwards, std::uint64_t restored)
{
    if (afterwards.compared == 0)
        return nothingCompared();
    if (afterwards.differing > 0)
        return {Verdict::Damaged, contract::kPLErrorPermissionsNotRepaired, 0,
                sentenceAbout(afterwards.differing, "those of %1$@ file still differ",
                              "those of %1$@ files still differ")};
    if (restored > 0)
        return {Verdict::Repaired, contract::kPLNoError, 0,
                sentenceAbout(restored, "%1$@ file was set right", "%1$@ files were set right")};
    return withoutDifferences(afterwards);
}

Outcome outcomeWithoutReferences(const Sentence& reason)
{
    if (reason.isEmpty())
        return {Verdict::Stopped, contract::kPLErrorCancelled, 0, {}};
    return {Verdict::Failed, contract::kPLErrorToolFailed, 0, reason};
}

std::string permissionsMessageOf(const Outcome& outcome, Operation operation,
                                 const std::string& diskName, const Texts& texts)
{
    return Sentence{messageKey(outcome, operation), diskName, outcome.reason.in(texts)}.in(texts);
}

}  // namespace pellar
