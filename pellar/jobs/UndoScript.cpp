// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/UndoScript.h"

#include "contract/pellar/ErrorCodes.h"
#include "contract/pellar/MessageKeys.h"
#include "pellar/jobs/RecordedWriting.h"
#include "pellar/partitions/MapDisk.h"

#include <utility>

namespace pellar {

UndoScript::UndoScript(UndoRequest request, JobContext context)
    : request_(std::move(request)), context_(std::move(context))
{
}

void UndoScript::run()
{
    log_.started();
    report(carryOut());
}

UndoScript::Failure UndoScript::carryOut()
{
    return request_.task.subject == Subject::PartitionMap ? onMap() : onVolume();
}

UndoScript::Failure UndoScript::onVolume()
{
    JobDisk disk(request_.disk, std::nullopt, request_.mounts, context_.options.systemPaths, log_);
    if (auto refusal = disk.take(Access::ReadWrite))
        return refusal;
    const DiskClaim& claim = disk.claim();
    FileRegion region(claim.descriptor(), claim.offset(), claim.availableBytes());
    Failure failure = carryOutOn(region, recordedDisk(*request_.disk, claim.descriptor(),
                                                      {claim.offset(), claim.availableBytes()}));
    disk.giveBack();
    return failure;
}

UndoScript::Failure UndoScript::onMap()
{
    const auto claim =
        MapClaim::take(*request_.disk, Access::ReadWrite, context_.options.systemPaths);
    if (!claim)
        return failedOutcome(claim.error(), {"the disk, or a part of it, is in use", {}, {}});
    FileRegion region(claim->descriptor(), claim->offset(), claim->length());
    Failure failure = carryOutOn(region, recordedDisk(*request_.disk, claim->descriptor(),
                                                      {claim->offset(), claim->length()}));
    if (!failure && !claim->rereadPartitions())
        log_.remark(
            Sentence{"The system has not taken up the repaired map yet; it does when "
                     "the disk is connected again.",
                     {},
                     {}});
    return failure;
}

UndoScript::Failure UndoScript::carryOutOn(Region& region, const RecordedDisk& disk)
{
    const auto store = openRecords(context_.options.trials);
    if (!store)
        return failedOutcome(contract::kPLErrorNothingToUndo, store.error());
    RecordList list = store->list();
    std::erase_if(list.records, [this](const ListedRecord& record) {
        return record.facts.repair.task.subject != request_.task.subject;
    });
    const ListedRecord* const newest = newestOf(disk, list);
    if (auto objection = objectionTo(newest))
        return objection;
    auto record = store->take(newest->id);
    if (!record)
        return failedOutcome(contract::kPLErrorNothingToUndo, record.error());
    return work(*record, region);
}

UndoScript::Failure UndoScript::objectionTo(const ListedRecord* record) const
{
    const uid_t user = context_.options.trials.user;
    if (record == nullptr)
        return failedOutcome(contract::kPLErrorNothingToUndo,
                             {"nothing is kept of a repair of it", {}, {}});
    if (user != 0 && record->facts.repair.user != user)
        return failedOutcome(contract::kPLErrorNotAuthorized,
                             {"another user asked for that repair", {}, {}});
    if (!isUndo() && record->facts.state == RecordState::Applied)
        return failedOutcome(contract::kPLErrorNothingToUndo,
                             {"its last repair was not interrupted", {}, {}});
    return std::nullopt;
}

UndoScript::Failure UndoScript::work(UndoRecord& record, Region& region)
{
    const RecordFacts& facts = record.facts();
    const std::string bytes = std::to_string(facts.changedBytes);
    log_.step(request_.task.operation,
              isUndo()
                  ? sentenceAbout(facts.rangeCount, "Putting back %1$@ place (%2$@ bytes)",
                                  "Putting back %1$@ places (%2$@ bytes)", bytes)
                  : sentenceAbout(facts.rangeCount, "Writing %1$@ place (%2$@ bytes) once more",
                                  "Writing %1$@ places (%2$@ bytes) once more", bytes));
    log_.flush();
    const UndoWork work = workOf(context_);
    const auto done = isUndo() ? record.undo(region, work) : record.finish(region, work);
    if (done)
        return std::nullopt;
    const UndoFailure& failure = done.error();
    if (failure.left == UndoFailure::Left::Interrupted)
        return failedOutcome(contract::kPLErrorInterrupted, failure.sentence);
    if (context_.stop.isPressed())
        return Outcome{Verdict::Stopped, contract::kPLErrorCancelled, 0, {}, {}};
    return failedOutcome(contract::kPLErrorNotUndone, failure.sentence);
}

void UndoScript::report(const Failure& failure)
{
    if (!failure) {
        const std::string message =
            log_.text({isUndo() ? "undid the repair of “%1$@”: it is as it was before"
                                : "finished the repair of “%1$@”",
                       log_.diskName(),
                       {}});
        log_.verdict(true, asLine(message));
        log_.finished(contract::kPLNoError, 0,
                      isUndo() ? contract::kPLVerdictUndone : contract::kPLVerdictRepaired,
                      message);
        return;
    }
    const std::string message =
        log_.text(failure->verdict == Verdict::Stopped
                      ? Sentence{"stopped; “%1$@” is as it was", log_.diskName(), {}}
                      : Sentence{isUndo() ? "cannot undo the repair of “%1$@”: %2$@"
                                          : "cannot finish the repair of “%1$@”: %2$@",
                                 log_.diskName(), log_.text(failure->reason)});
    log_.failure(asLine(message));
    log_.finished(*failure, message);
}

}  // namespace pellar
