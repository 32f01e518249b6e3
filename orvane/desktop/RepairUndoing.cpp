// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/RepairUndoing.h"

#include "contract/pellar/MessageKeys.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QDateTime>
#include <QLocale>

#include <utility>

namespace orvane::desktop {
namespace {

using pellar::Operation;

std::string timeOf(const pellar::ListedRecord& record)
{
    const auto seconds = std::chrono::system_clock::to_time_t(record.facts.repair.time);
    return fromQt(QLocale().toString(QDateTime::fromSecsSinceEpoch(seconds), QLocale::ShortFormat));
}

std::string number(std::uint64_t value)
{
    return fromQt(QLocale().toString(static_cast<qulonglong>(value)));
}

pellar::Task taskFor(Operation operation, RepairUndoing::Scope scope, const Disk& disk)
{
    if (scope == RepairUndoing::Scope::Permissions)
        return {pellar::Subject::Permissions, operation};
    return {disk.isWhole() ? pellar::Subject::PartitionMap : pellar::Subject::Filesystem,
            operation};
}

/// What is asked, with the disk's name in it.
std::string_view questionKeyOf(pellar::Task task)
{
    if (task.subject == pellar::Subject::Permissions)
        return "Undo the repair of the permissions on “%@”?";
    return task.operation == Operation::Undo ? "Undo the repair of “%@”?"
                                             : "Finish the repair of “%@”?";
}

}  // namespace

RepairUndoing::RepairUndoing(const SessionParts& parts, const DiskPane& disks, KeptRepairs& kept,
                             const pellar::Texts& texts, const pellar::JobOptions& options,
                             std::function<void()> update)
    : at_(parts),
      disks_(disks),
      kept_(kept),
      update_(std::move(update)),
      library_(parts.host.mainRunLoop(), texts, options)
{
}

// None unless one disk alone is selected, and is there; for permissions, mounted.
std::shared_ptr<Disk> RepairUndoing::disk(Scope scope) const
{
    const auto selected = disks_.selected();
    if (selected.size() != 1)
        return nullptr;
    const auto& disk =
        selected.front()->isOfflineDiskImage() ? selected.front()->contents() : selected.front();
    const bool isThere = disk && !disk->hasGone();
    return isThere && (scope == Scope::Disk || disk->isMounted()) ? disk : nullptr;
}

std::string RepairUndoing::reasonAgainst(Operation operation, Scope scope)
{
    kept_.read();
    const auto disk = this->disk(scope);
    const std::string_view reason = desktop::reasonAgainst(
        operation,
        {disks_.selected().size(), at_.controller.interfaceLock(), disk != nullptr,
         disk ? kept_.stateOf(taskFor(operation, scope, *disk).subject, *disk) : KeptRepair::None,
         scope == Scope::Permissions});
    return reason.empty() ? std::string() : text(reason);
}

void RepairUndoing::ask(Operation operation, Scope scope)
{
    if (const std::string reason = reasonAgainst(operation, scope); !reason.empty()) {
        at_.host.showSheet("", {reason});
        return;
    }
    const auto disk = this->disk(scope);
    desktop::ask(at_.window, questionAbout(taskFor(operation, scope, *disk), disk));
}

Question RepairUndoing::questionAbout(pellar::Task task, const std::shared_ptr<Disk>& disk)
{
    const bool isUndo = task.operation == Operation::Undo;
    return {"undoQuestion",
            at_.host.translator().sentence(questionKeyOf(task), {disk->displayName()}),
            meaningOf(task, kept_.newestOf(task.subject, *disk)),
            {{text(isUndo ? "Undo Repair" : "Finish Repair"),
              [this, task, disk] {
                  begin(task, disk);
              }}},
            text("Cancel")};
}

std::string RepairUndoing::meaningOf(pellar::Task task, const pellar::ListedRecord* record)
{
    const Translator& texts = at_.host.translator();
    const bool isUndo = task.operation == Operation::Undo;
    const bool isOfPermissions = task.subject == pellar::Subject::Permissions;
    std::string meaning;
    if (record != nullptr && isOfPermissions)
        meaning = texts.sentence("It was done on %1$@.", {timeOf(*record)});
    else if (record == nullptr)
        meaning = text("What is kept of it is known only with an administrator’s rights.");
    else
        meaning = texts.sentence(
            isUndo ? "What the repair of %1$@ has overwritten is put back: %2$@ bytes in %3$@ "
                     "places."
                   : "What the repair of %1$@ was to change is written once more: %2$@ bytes in "
                     "%3$@ places.",
            {timeOf(*record), number(record->facts.changedBytes),
             number(record->facts.rangeCount)});
    if (isOfPermissions)
        return meaning + " " +
               text(
                   "Each file that is still as that repair left it has again the owner, group and "
                   "permissions that it had before.");
    return meaning + " " +
           text(isUndo ? "The damage that it repaired is then there again."
                       : "The disk is then as the repair was to leave it.");
}

void RepairUndoing::begin(pellar::Task task, const std::shared_ptr<Disk>& disk)
{
    if (at_.controller.interfaceLock())
        return;
    title_ = HostJob::titleOf(task, *disk, at_.host.translator());
    at_.controller.setSelection({disk});
    at_.controller.setInterfaceLock();
    update_();
    showProgress(title_);
    job_ =
        std::make_unique<HostJob>(library_, at_.host, disk,
                                  HostJob::Events{[this] { at_.tabs.reloadLog(); },
                                                  [this](double percent) {
                                                      at_.window.progress().setIndeterminate(false);
                                                      at_.window.progress().setPercent(percent);
                                                  }});
    const auto stop = [this] {
        job_->stop();
    };
    at_.tabs.setStopOfHostJob(stop);
    at_.window.progress().setStop(stop);
    job_->begin(task);
}

void RepairUndoing::showProgress(const std::string& title)
{
    ProgressArea& progress = at_.window.progress();
    progress.setText(title);
    progress.setTextActive(true);
    progress.setPercent(0);
    progress.setIndeterminate(true);
    progress.setBarActive(true);
}

// Posted, because the job has not told the last of it when the ledger hears of its end.
void RepairUndoing::runEnded(const StartedRun& run, const RunEnd& end)
{
    if (run.task.isUndo())
        at_.host.mainRunLoop().post([this, end] { finish(title_, end); });
}

void RepairUndoing::finish(const std::string& title, const RunEnd& end)
{
    at_.tabs.setStopOfHostJob({});
    ProgressArea& progress = at_.window.progress();
    progress.setStop({});
    progress.setBarActive(false);
    progress.setTextActive(false);
    job_.reset();
    at_.tabs.reloadLog();
    at_.controller.resetInterfaceLock();
    const bool isToBeSaid =
        end.errorCode != contract::kPLNoError && end.errorCode != contract::kPLErrorCancelled;
    if (!isToBeSaid)
        return;
    std::vector<std::string> sentences{at_.host.OVLocalizedErrorString(end.errorCode)};
    if (!end.message.empty() && end.message != sentences.front())
        sentences.push_back(end.message);
    at_.host.showSheet(title, sentences);
}

}  // namespace orvane::desktop
