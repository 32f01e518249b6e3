// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/RepairUndoing.h"

#include "contract/pellar/MessageKeys.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/desktop/window/Question.h"

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

pellar::Task taskFor(Operation operation, const Disk& disk)
{
    return {disk.isWhole() ? pellar::Subject::PartitionMap : pellar::Subject::Filesystem,
            operation};
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

// None unless one disk alone is selected, and is there.
std::shared_ptr<Disk> RepairUndoing::disk() const
{
    const auto selected = disks_.selected();
    if (selected.size() != 1)
        return nullptr;
    const auto& disk =
        selected.front()->isOfflineDiskImage() ? selected.front()->contents() : selected.front();
    return disk && !disk->hasGone() ? disk : nullptr;
}

std::string RepairUndoing::reasonAgainst(Operation operation)
{
    kept_.read();
    const auto disk = this->disk();
    const std::string_view reason = desktop::reasonAgainst(
        operation, {disks_.selected().size(), at_.controller.interfaceLock(), disk != nullptr,
                    disk ? kept_.stateOf(*disk) : KeptRepair::None});
    return reason.empty() ? std::string() : text(reason);
}

void RepairUndoing::ask(Operation operation)
{
    if (const std::string reason = reasonAgainst(operation); !reason.empty()) {
        at_.host.showSheet("", {reason});
        return;
    }
    const auto disk = this->disk();
    const pellar::Task task = taskFor(operation, *disk);
    const bool isUndo = operation == Operation::Undo;
    desktop::ask(at_.window, {"undoQuestion",
                              at_.host.translator().sentence(isUndo ? "Undo the repair of “%@”?"
                                                                    : "Finish the repair of “%@”?",
                                                             {disk->displayName()}),
                              meaningOf(operation, kept_.newestOf(*disk)),
                              {{text(isUndo ? "Undo Repair" : "Finish Repair"),
                                [this, task, disk] {
                                    begin(task, disk);
                                }}},
                              text("Cancel")});
}

std::string RepairUndoing::meaningOf(Operation operation, const pellar::ListedRecord* record)
{
    const Translator& texts = at_.host.translator();
    const bool isUndo = operation == Operation::Undo;
    std::string meaning;
    if (record == nullptr)
        meaning = text("What is kept of it is known only with an administrator’s rights.");
    else
        meaning = texts.sentence(
            isUndo ? "What the repair of %1$@ has overwritten is put back: %2$@ bytes in %3$@ "
                     "places."
                   : "What the repair of %1$@ was to change is written once more: %2$@ bytes in "
                     "%3$@ places.",
            {timeOf(*record), number(record->facts.changedBytes),
             number(record->facts.rangeCount)});
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
