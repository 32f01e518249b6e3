// SPDX-License-Identifier: Apache-2.0
#include "pellar/undo/UndoRecord.h"

#include "pellar/undo/PublicIndex.h"

#include <cassert>
#include <system_error>
#include <utility>

namespace pellar {
namespace {

using Cause = UndoFault::Cause;
using Done = Result<void, UndoFailure>;

std::string textOf(int error)
{
    return std::generic_category().message(error);
}

Done unchanged(UndoFault fault)
{
    return UndoFailure{unchangedBecause(fault), UndoFailure::Left::Unchanged};
}

Sentence interruptedBecause(UndoFault fault)
{
    switch (fault.cause) {
        case Cause::DiskForgetful:
            return {
                "the disk does not keep what is written to it, and is now partly as before and "
                "partly as after the repair",
                {},
                {}};
        case Cause::RecordFailed:
            return {
                "the saved bytes cannot be read (%1$@), and the disk is now partly as before "
                "and partly as after the repair",
                textOf(fault.error),
                {}};
        case Cause::DiskUnreadable:
            return {
                "the disk cannot be read (%1$@), and is now partly as before and partly as "
                "after the repair",
                textOf(fault.error),
                {}};
        default:
            return {
                "the disk cannot be written (%1$@), and is now partly as before and partly as "
                "after the repair",
                textOf(fault.error),
                {}};
    }
}

Done interrupted(Sentence sentence)
{
    return UndoFailure{std::move(sentence), UndoFailure::Left::Interrupted};
}

}  // namespace

Sentence unchangedBecause(UndoFault fault)
{
    const std::string error = textOf(fault.error);
    switch (fault.cause) {
        case Cause::Stopped: return {"nothing was changed: it was stopped", {}, {}};
        case Cause::DiskChanged: return {"nothing was changed: the disk was changed since", {}, {}};
        case Cause::DiskUnreadable:
            return {"nothing was changed: the disk cannot be read (%1$@)", error, {}};
        case Cause::DiskUnwritable:
            return {"nothing was changed: the disk cannot be written (%1$@)", error, {}};
        case Cause::DiskForgetful:
            return {"nothing was changed: the disk does not keep what is written to it", {}, {}};
        case Cause::ResultUnreadable:
            return {"nothing was changed: the repaired bytes cannot be read (%1$@)", error, {}};
        case Cause::RecordDamaged:
            return {"nothing was changed: the saved bytes are damaged", {}, {}};
        case Cause::RecordFailed: break;
    }
    return {"nothing was changed: the bytes kept for undoing cannot be written or read (%1$@)",
            error,
            {}};
}

UndoRecord::UndoRecord(UndoRecord&& other) noexcept
    : directory_(std::move(other.directory_)),
      index_(std::move(other.index_)),
      shownInUse_(std::move(other.shownInUse_)),
      facts_(std::move(other.facts_)),
      ranges_(std::move(other.ranges_)),
      stage_(std::exchange(other.stage_, Stage::Removed))
{
}

UndoRecord::~UndoRecord()
{
    if (stage_ == Stage::Uncommitted)
        (void)remove();  // what stays was never committed, and goes with the next listing
}

Done UndoRecord::apply(Region& disk, const UndoWork& work)
{
    assert(stage_ == Stage::Uncommitted);
    RangePasses passes(directory_, ranges_, work, 3);
    if (const auto fault = passes.compare(disk, digests(), RangePasses::Expected::Before))
        return unchanged(*fault);
    int error = publish(RecordState::Applying);
    if (error == 0)
        error = commit(RecordState::Applying);
    if (error != 0) {
        (void)remove();  // what stays counts as interrupted, and the disk is as before
        return unchanged({Cause::RecordFailed, error});
    }
    stage_ = Stage::Committed;
    const auto fault =
        passes.write(disk, RecordDirectory::afterName, RangePasses::Writing::Everything);
    return fault ? putBack(disk, *fault, passes) : complete();
}

Done UndoRecord::putBack(Region& disk, UndoFault fault, RangePasses& passes)
{
    if (const auto another =
            passes.write(disk, RecordDirectory::beforeName, RangePasses::Writing::WhatDiffers))
        return interrupted(interruptedBecause(*another));
    (void)remove();  // what stays counts as interrupted, and the disk is as before
    return unchanged(fault);
}

Done UndoRecord::undo(Region& disk, const UndoWork& work)
{
    assert(stage_ == Stage::Committed);
    RangePasses passes(directory_, ranges_, work, 3);
    const auto obstacle = facts_.state == RecordState::Applied
                              ? passes.saveAfterFrom(disk, digests())
                              : passes.compare(disk, digests(), RangePasses::Expected::Mixture);
    if (obstacle)
        return unchanged(*obstacle);
    // Of one that was interrupted everybody knows that already.
    const bool isNew = facts_.state == RecordState::Applied;
    if (const int error = publish(RecordState::Undoing); error != 0 && isNew)
        return unchanged({Cause::RecordFailed, error});
    if (const int error = commit(RecordState::Undoing))
        return unchanged({Cause::RecordFailed, error});
    if (const auto fault =
            passes.write(disk, RecordDirectory::beforeName, RangePasses::Writing::Everything))
        return interrupted(interruptedBecause(*fault));
    if (const int error = remove())
        return interrupted(
            {"the disk is as before the repair, but the saved bytes cannot be "
             "removed (%1$@)",
             textOf(error),
             {}});
    return {};
}

Done UndoRecord::finish(Region& disk, const UndoWork& work)
{
    assert(stage_ == Stage::Committed && facts_.state != RecordState::Applied);
    RangePasses passes(directory_, ranges_, work, 3);
    if (const auto obstacle = passes.compare(disk, digests(), RangePasses::Expected::Mixture))
        return unchanged(*obstacle);
    (void)publish(RecordState::Applying);  // the next listing mends what this could not
    if (const int error = commit(RecordState::Applying))
        return unchanged({Cause::RecordFailed, error});
    if (const auto fault =
            passes.write(disk, RecordDirectory::afterName, RangePasses::Writing::Everything))
        return interrupted(interruptedBecause(*fault));
    return complete();
}

// Not taken back when the state cannot be kept: the record may already say Applied, and then the
// disk must be as after. As it is now, it is what the record says in either state.
Done UndoRecord::complete()
{
    if (const int error = commit(RecordState::Applied))
        return interrupted(
            {"the disk is repaired, but that cannot be recorded (%1$@)", textOf(error), {}});
    (void)publish(RecordState::Applied);  // the next listing mends what this could not
    (void)directory_.removeFile(RecordDirectory::afterName);  // else it only takes room
    return {};
}

/// Before the record itself says so: what is said to everybody is rather too grave than too light.
int UndoRecord::publish(RecordState state)
{
    if (!index_)
        return 0;
    RecordFacts facts = facts_;
    facts.state = state;
    auto shown = index_->publish(id(), facts);
    if (!shown)
        return shown.error();
    shownInUse_ = std::move(*shown);
    return 0;
}

int UndoRecord::commit(RecordState state)
{
    RecordFacts facts = facts_;
    facts.state = state;
    const int error = directory_.replaceFacts(encodeFacts(facts));
    if (error == 0) {
        facts_ = std::move(facts);
        return 0;
    }
    // Which of the two are there is for the next attempt to know.
    if (const auto text = directory_.readFile(RecordDirectory::factsName, largestFacts))
        if (const auto kept = decodeFacts(*text))
            facts_ = *kept;
    return error;
}

int UndoRecord::remove()
{
    stage_ = Stage::Removed;
    const int error = directory_.remove();
    return error == 0 && index_ ? index_->remove(id()) : error;
}

}  // namespace pellar
