// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/window/ResultSummary.h"

#include "contract/foundation/UTF8.h"
#include "contract/pellar/ErrorCodes.h"
#include "contract/pellar/MessageKeys.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/desktop/window/SelectionSummary.h"
#include "pellar/outcome/Task.h"

#include <QLocale>

#include <algorithm>
#include <array>
#include <filesystem>

namespace orvane::desktop {
namespace {

using pellar::Operation;
using pellar::Subject;

/// How a run ended, in the terms that decide what is said of it.
struct Ending {
    Subject subject;
    Operation operation;
    std::string_view verdict;
    contract::ErrorCode error;
    bool hasLosses;

    bool is(const contract::Name& other) const { return verdict == other.text(); }
};

Ending endingOf(const Check& check)
{
    const auto task = pellar::taskNamed(check.action).value_or(pellar::Task{});
    return {task.subject, task.operation, check.verdict, check.errorCode, check.hasLosses};
}

bool isUnreadable(const Ending& ending)
{
    return ending.error == contract::kPLErrorUnreadable;
}

/// Nothing of ours brings back what is missing.
bool isBeyondRepair(const Ending& ending)
{
    constexpr std::array codes{contract::kPLErrorDamagedForGood, contract::kPLErrorNoRepairHere,
                               contract::kPLErrorCutShort, contract::kPLErrorMapNeedsPerson};
    return std::ranges::count(codes, ending.error) != 0;
}

Tone toneOf(const Ending& ending)
{
    if (ending.hasLosses)
        return Tone::Caution;
    if (ending.is(contract::kPLVerdictSound) || ending.is(contract::kPLVerdictRepaired))
        return Tone::Good;
    if (ending.is(contract::kPLVerdictDamaged))
        return Tone::Bad;
    const bool isNoNews = ending.verdict.empty() || ending.is(contract::kPLVerdictStopped) ||
                          ending.is(contract::kPLVerdictUndone);
    return isNoNews ? Tone::Neutral : Tone::Caution;
}

std::string_view titleOfPermissions(const Ending& ending)
{
    if (ending.is(contract::kPLVerdictSound))
        return "The permissions are as they should be.";
    if (ending.is(contract::kPLVerdictRepaired))
        return "The permissions were set to what they should be.";
    if (ending.is(contract::kPLVerdictDamaged))
        return ending.operation == Operation::Verify
                   ? "Some permissions are not as they should be. Nothing was changed."
                   : "Some permissions still differ from what they should be.";
    return ending.operation == Operation::Verify ? "The permissions could not be verified."
                                                 : "The permissions could not be repaired.";
}

std::string_view titleOfVerification(const Ending& ending)
{
    if (ending.is(contract::kPLVerdictSound))
        return "No damage was found.";
    if (ending.is(contract::kPLVerdictDamaged))
        return "Damage was found. Nothing was changed.";
    if (ending.is(contract::kPLVerdictInconclusive))
        return "It could not be determined whether there is damage.";
    return "The check did not come to an answer.";
}

std::string_view titleOfRepair(const Ending& ending)
{
    if (ending.error == contract::kPLErrorNotProven)
        return "A repair was tried, and would leave damage. Nothing was changed.";
    if (ending.error == contract::kPLErrorNotTried)
        return "The repair could not be tried first. Nothing was changed.";
    if (ending.is(contract::kPLVerdictRepaired))
        return ending.hasLosses ? "Repaired, but files were lost or moved."
                                : "Repaired. No damage is left.";
    if (ending.is(contract::kPLVerdictSound))
        return "No damage was found. Nothing had to be repaired.";
    // What only a preview says: a repair that is done leaves another error.
    if (ending.error == contract::kPLErrorDamaged)
        return "A repair was tried, and would leave no damage. Nothing was changed.";
    return ending.is(contract::kPLVerdictDamaged) ? "Damage is left after the repair."
                                                  : "There was no repair.";
}

std::string_view titleOf(const Ending& ending)
{
    if (ending.verdict.empty())
        return "The last job was cut off.";
    if (ending.is(contract::kPLVerdictStopped))
        return ending.operation == Operation::Verify ? "The check was stopped."
                                                     : "The repair was stopped.";
    if (ending.is(contract::kPLVerdictUndone))
        return "The repair was taken back. The disk is as it was before it.";
    if (isUnreadable(ending))
        return "The disk cannot be read in places. Nothing was changed.";
    if (ending.operation == Operation::Undo)
        return "The repair was not taken back.";
    if (ending.subject == Subject::Permissions)
        return titleOfPermissions(ending);
    return ending.operation == Operation::Verify ? titleOfVerification(ending)
                                                 : titleOfRepair(ending);
}

/// With the number of problems, where it is known.
std::string titleOf(const Check& check, const Ending& ending, const Translator& texts)
{
    const bool isCounted = ending.subject == Subject::Filesystem &&
                           ending.operation == Operation::Verify && check.problems > 0 &&
                           ending.error == contract::kPLErrorDamaged;
    if (!isCounted)
        return texts.text(titleOf(ending));
    const auto number = [](std::int64_t value) {
        return fromQt(QLocale().toString(static_cast<qlonglong>(value)));
    };
    if (check.problems == 1)
        return texts.text("Damaged: 1 problem. Nothing was changed.");
    return check.kinds <= 1
               ? texts.sentence("Damaged: %@ problems of one kind. Nothing was changed.",
                                {number(check.problems)})
               : texts.sentence("Damaged: %@ problems of %@ kinds. Nothing was changed.",
                                {number(check.problems), number(check.kinds)});
}

std::vector<NextStep> stepsAfter(const Ending& ending, const DiskRow& disk,
                                 const ResultSituation& situation)
{
    std::vector<NextStep> steps;
    const bool isOfDisk = ending.subject != Subject::Permissions;
    const bool isDamaged = ending.is(contract::kPLVerdictDamaged);
    const bool mustBeCopied = disk.facts.hasSMARTError || isUnreadable(ending);
    if (isOfDisk && (mustBeCopied || isBeyondRepair(ending))) {
        steps.push_back(NextStep::CopyDisk);
    } else if (ending.error == contract::kPLErrorNotProven) {
        steps = {NextStep::ApplyUnproven, NextStep::CopyDisk};
    } else if (ending.error == contract::kPLErrorNotTried) {
        steps = {NextStep::RepairDirectly, NextStep::CopyDisk};
    } else if (isOfDisk && isDamaged && situation.canRepair) {
        steps.push_back(NextStep::Repair);
        // A preview has said what there is to say.
        if (ending.operation == Operation::Verify && ending.subject == Subject::Filesystem)
            steps.push_back(NextStep::Preview);
    } else if (ending.is(contract::kPLVerdictRepaired)) {
        if (isOfDisk ? situation.canUndo : situation.canUndoPermissions)
            steps.push_back(isOfDisk ? NextStep::Undo : NextStep::UndoPermissions);
    }
    if (isDamaged || ending.is(contract::kPLVerdictRepaired))
        steps.push_back(NextStep::ShowProblems);
    return steps;
}

std::string asSentence(const std::string& message)
{
    const QString text = capitalized(toQtLine(message));
    const bool isOpen = !text.isEmpty() && text.back().isLetterOrNumber();
    return fromQt(isOpen ? text + QLatin1Char('.') : text);
}

Tone worse(Tone a, Tone b)
{
    return std::max(a, b);
}

}  // namespace

ResultSummary resultOf(const DiskRow& disk, const ResultSituation& situation,
                       const Translator& texts)
{
    if (!disk.activity.empty())
        return {};
    if (situation.isInterrupted)
        return {Tone::Bad,
                texts.text("A repair was interrupted, and only a part of it is written."),
                texts.text("Finishing it writes the rest. Undoing it puts back what it has "
                           "overwritten. Until then, the disk is neither as before nor repaired; "
                           "do not use it."),
                {NextStep::Finish, NextStep::Undo},
                {}};
    if (!disk.lastCheck && disk.facts.hasSMARTError)
        return {Tone::Caution,
                texts.text("The drive says that it is failing."),
                texts.text("Copy what matters before anything else is done to it."),
                {NextStep::CopyDisk},
                {}};
    if (!disk.lastCheck || disk.lastCheck->isPartial || !disk.lastCheck->part.empty())
        return {};
    const LastCheck& check = *disk.lastCheck;
    const Check& last = check.later ? *check.later : check.told;
    const Ending ending = endingOf(last);
    return {toneOf(ending),
            titleOf(last, ending, texts),
            asSentence(last.message),
            stepsAfter(ending, disk, situation),
            {}};
}

ResultSummary resultOfClosing(const std::vector<std::string>& images, const Translator& texts)
{
    if (images.empty())
        return {};
    const auto count = static_cast<long>(images.size());
    const std::string name =
        contract::printable(std::filesystem::path(images.front()).filename().native());
    return {Tone::Neutral,
            count == 1 ? texts.sentence("“%@” was closed.", {name})
                       : texts.sentence("%ld images were closed.", {count}),
            texts.text(count == 1 ? "The file and its history stay as they are."
                                  : "The files and their histories stay as they are."),
            {NextStep::Reopen},
            {}};
}

ResultSummary resultOfSeveral(const std::vector<DiskRow>& disks, const Translator& texts)
{
    ResultSummary summary;
    std::vector<DiskRow> checked;
    const QStringList names = distinctNames(disks);
    for (std::size_t i = 0; i < disks.size(); ++i) {
        const DiskRow& disk = disks[i];
        if (!disk.activity.empty())
            return {};
        if (!disk.lastCheck)
            continue;
        const LastCheck& check = *disk.lastCheck;
        checked.push_back(disk);
        const Tone tone = check.isPartial ? Tone::Neutral : toneOf(endingOf(check.told));
        summary.tone = worse(summary.tone, tone);
        if (tone == Tone::Bad || tone == Tone::Caution)
            summary.disks.push_back(
                {fromQt(names[static_cast<qsizetype>(i)]), disk.facts.identifier});
    }
    if (checked.empty())
        return {};
    const auto count = static_cast<long>(checked.size());
    summary.title = contract::format(
        texts.plural("%ld disk was checked: %@.", "%ld disks were checked: %@.", count),
        {count, fromQt(countsOf(checked, texts))});
    return summary;
}

}  // namespace orvane::desktop
