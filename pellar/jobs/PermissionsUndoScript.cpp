// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/PermissionsUndoScript.h"

#include "contract/foundation/UTF8.h"
#include "contract/pellar/ErrorCodes.h"
#include "contract/pellar/MessageKeys.h"
#include "pellar/jobs/RecordedRestoring.h"

#include <unistd.h>

#include <algorithm>
#include <system_error>
#include <utility>

namespace pellar {
namespace {

constexpr std::size_t batchSize = 64;

Outcome nothingKept()
{
    return failedOutcome(contract::kPLErrorNothingToUndo,
                         {"nothing is kept of a repair of its permissions", {}, {}});
}

}  // namespace

PermissionsUndoScript::PermissionsUndoScript(contract::DiskReferencePointer disk,
                                             JobContext context)
    : disk_(std::move(disk)), context_(std::move(context))
{
    log_.leaveLinesOpen();
}

void PermissionsUndoScript::run()
{
    log_.started();
    report(carryOut());
}

PermissionsUndoScript::Failure PermissionsUndoScript::carryOut()
{
    if (::geteuid() != 0)
        return failedOutcome(contract::kPLErrorNotAdministrator,
                             {"only an administrator may set permissions", {}, {}});
    const auto root = RootDirectory::open(disk_->mountPoint);
    if (!root)
        return failedOutcome(contract::kPLErrorCannotOpen,
                             {"the root of the system cannot be opened", {}, {}});
    if (context_.options.trials.room.directory.empty())
        return nothingKept();
    const auto store = openPermissionRecords(context_.options.trials);
    if (!store)
        return failedOutcome(contract::kPLErrorNothingToUndo, store.error());
    const PermissionRecordList list = store->list();
    const ListedPermissionRecord* const newest =
        newestOf(permissionsRunOn(*disk_, *root, context_), list);
    if (auto objection = objectionTo(newest))
        return objection;
    auto record = store->take(newest->id);
    if (!record)
        return failedOutcome(contract::kPLErrorNothingToUndo, record.error());
    return work(*root, *record);
}

PermissionsUndoScript::Failure PermissionsUndoScript::objectionTo(
    const ListedPermissionRecord* record) const
{
    const uid_t user = context_.options.trials.user;
    if (record == nullptr)
        return nothingKept();
    if (user != 0 && record->run.repair.user != user)
        return failedOutcome(contract::kPLErrorNotAuthorized,
                             {"another user asked for that repair", {}, {}});
    return std::nullopt;
}

// What a directory holds comes before the directory, the other way round than it was repaired.
PermissionsUndoScript::Failure PermissionsUndoScript::work(const RootDirectory& root,
                                                           PermissionRecord& record)
{
    std::vector<std::size_t> places;
    for (std::size_t i = record.changes().size(); i-- > 0;)
        if (record.changes()[i].stage != ChangeStage::Settled)
            places.push_back(i);
    log_.step(Operation::Undo,
              sentenceAbout(places.size(), "Putting back the permissions of %1$@ file",
                            "Putting back the permissions of %1$@ files"));
    log_.flush();
    for (std::size_t i = 0; i < places.size() && !context_.stop.isPressed(); i += batchSize) {
        const std::size_t end = std::min(i + batchSize, places.size());
        takeBackBatch(root, record,
                      {places.begin() + static_cast<std::ptrdiff_t>(i),
                       places.begin() + static_cast<std::ptrdiff_t>(end)});
        log_.progress(100.0 * static_cast<double>(end) / static_cast<double>(places.size()));
        log_.flushIfDue();
    }
    log_.endOfRun();
    if (record.damagedLines() > 0)
        log_.error(
            sentenceAbout(record.damagedLines(),
                          "%1$@ entry of the record is damaged; what it tells is not undone.",
                          "%1$@ entries of the record are damaged; what they tell is not "
                          "undone."));
    return end(record);
}

// The notes serve an undo that is interrupted. Where they cannot be written, because the medium is
// full, the files are put back all the same.
void PermissionsUndoScript::takeBackBatch(const RootDirectory& root, PermissionRecord& record,
                                          const std::vector<std::size_t>& batch)
{
    std::vector<RecordedChange> changes;
    for (const std::size_t place : batch) {
        changes.push_back(record.changes()[place]);
        static_cast<void>(record.note(place, ChangeStage::TakingBack));
    }
    static_cast<void>(record.sync());
    for (std::size_t i = 0; i < batch.size(); ++i)
        takeBackOne(root, record, batch[i], changes[i]);
}

void PermissionsUndoScript::takeBackOne(const RootDirectory& root, PermissionRecord& record,
                                        std::size_t place, const RecordedChange& change)
{
    if (context_.stop.isPressed()) {  // it is again known exactly how it is
        static_cast<void>(record.note(place, change.stage, change.after));
        return;
    }
    const TakingBack result = takeBack(root, record.run().rootDevice, change);
    if (settles(result, contract::printable(change.path)))
        static_cast<void>(record.note(place, ChangeStage::Settled));
    else
        ++kept_;
}

bool PermissionsUndoScript::settles(const TakingBack& result, const std::string& path)
{
    if (std::holds_alternative<PutBack>(result)) {
        ++putBack_;
        log_.detail(Sentence{"“%1$@” was put back.", path, {}});
        return true;
    }
    if (std::holds_alternative<AsBefore>(result)) {
        ++asBefore_;
        return true;
    }
    ++leftAlone_;
    if (const auto* const unseen = std::get_if<Unseen>(&result))
        return settlesUnseen(*unseen, path);
    if (const auto* const refusal = std::get_if<NotPermitted>(&result)) {
        log_.problem(Sentence{"“%1$@” cannot be put back: %2$@.", path,
                              std::generic_category().message(refusal->error)});
        return false;
    }
    log_.problem(
        Sentence{std::holds_alternative<ChangedSince>(result)
                     ? "“%1$@” was changed since and was left alone."
                     : "“%1$@” lent rights before, and it is not known what it held then; it was "
                       "left alone.",
                 path,
                 {}});
    return true;
}

/// What another volume hides, or cannot be read now, may be put back another time.
bool PermissionsUndoScript::settlesUnseen(Unseen unseen, const std::string& path)
{
    switch (unseen) {
        case Unseen::Missing: log_.problem(Sentence{"“%1$@” is not there.", path, {}}); return true;
        case Unseen::BehindLink:
            log_.problem(
                Sentence{"“%1$@” is behind a symbolic link, which is not followed.", path, {}});
            return true;
        case Unseen::Unreadable:
            log_.problem(Sentence{"“%1$@” cannot be read.", path, {}});
            return false;
        case Unseen::ElsewhereMounted:
            log_.problem(Sentence{"“%1$@” is hidden by another volume.", path, {}});
            return false;
    }
    return false;
}

PermissionsUndoScript::Failure PermissionsUndoScript::end(PermissionRecord& record)
{
    if (context_.stop.isPressed()) {
        static_cast<void>(record.sync());
        log_.remark(numbers());
        return Outcome{Verdict::Stopped, contract::kPLErrorCancelled, 0, {}, {}};
    }
    const int error = kept_ > 0 ? record.sync() : record.remove();
    if (error != 0)
        log_.error(Sentence{"what was kept of it cannot be removed: %1$@",
                            std::generic_category().message(error),
                            {}});
    if (putBack_ + asBefore_ == 0 && leftAlone_ > 0)
        return failedOutcome(
            contract::kPLErrorNotUndone,
            sentenceAbout(leftAlone_, "%1$@ file was left alone", "%1$@ files were left alone"));
    return std::nullopt;
}

Sentence PermissionsUndoScript::numbers() const
{
    return sentenceAbout(putBack_, "%1$@ file was put back; left alone: %2$@",
                         "%1$@ files were put back; left alone: %2$@", std::to_string(leftAlone_));
}

void PermissionsUndoScript::report(const Failure& failure)
{
    if (!failure) {
        const std::string message =
            log_.text({"undid the repair of the permissions on “%1$@”: %2$@", log_.diskName(),
                       log_.text(numbers())});
        log_.verdict(true, asLine(message));
        log_.finished(contract::kPLNoError, 0, contract::kPLVerdictUndone, message);
        return;
    }
    const bool isStopped = failure->verdict == Verdict::Stopped;
    const std::string message = log_.text(
        isStopped ? Sentence{"stopped while undoing the repair of the permissions on “%1$@”",
                             log_.diskName(),
                             {}}
                  : Sentence{"cannot undo the repair of the permissions on “%1$@”: %2$@",
                             log_.diskName(), log_.text(failure->reason)});
    if (!isStopped)
        log_.failure(asLine(message));
    log_.finished(*failure, message);
}

}  // namespace pellar
