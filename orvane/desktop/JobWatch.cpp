// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/JobWatch.h"

#include "contract/foundation/UTF8.h"
#include "contract/pellar/ErrorCodes.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/jobs/UnavailableReason.h"
#include "orvane/support/settings/Switch.h"

#include <QApplication>

#include <algorithm>
#include <utility>

namespace orvane::desktop {
namespace {

using pellar::Operation;
using pellar::Subject;

std::string_view statusKey(pellar::Task task)
{
    const bool isOfPermissions = task.subject == Subject::Permissions;
    const bool isOfMap = task.subject == Subject::PartitionMap;
    switch (task.operation) {
        case Operation::Verify:
            return isOfPermissions ? "Verifying permissions on “%@”"
                   : isOfMap       ? "Verifying the partition map of “%@”"
                                   : "Verifying “%@”";
        case Operation::Undo: return "Undoing the repair of “%@”";
        case Operation::Finish: return "Finishing the repair of “%@”";
        case Operation::Repair: break;
    }
    return isOfPermissions ? "Repairing permissions on “%@”"
           : isOfMap       ? "Repairing the partition map of “%@”"
                           : "Repairing “%@”";
}

/// Whether the run is about the disk, or about what is in it.
bool isAbout(const std::string& run, const std::string& disk)
{
    return run == disk || run.starts_with(disk + "#");
}

}  // namespace

JobWatch::JobWatch(const SessionParts& parts, DiskPane& disks, WindowCloser& closer,
                   const SessionBuses& buses, std::chrono::milliseconds glance,
                   std::function<void()> updated)
    : at_(parts),
      disks_(disks),
      closer_(closer),
      longestGlanceAway_(glance),
      updated_(std::move(updated)),
      wakefulness_(buses.system),
      notifier_({buses.session, desktopEntry, text("Show"),
                 [this] {
                     QWidget& window = at_.window;
                     window.setWindowState(window.windowState() & ~Qt::WindowMinimized);
                     window.raise();
                     window.activateWindow();
                 }}),
      taskBar_(buses.session, desktopEntry)
{
}

void JobWatch::lockChanged(bool isLocked)
{
    if (isLocked)
        begin();
    else
        end();
}

void JobWatch::begin()
{
    job_ = {at_.tabs.lastAction(), disks_.selected()};
    job_.isCheck = at_.tabs.lastActionIsCheck();
    // What the modules see as selected when the window is locked is what the job works on.
    disks_.hold(at_.controller.allSelectedItemsFilterDuplicates(false, true));
}

void JobWatch::reported(const contract::Dictionary& report)
{
    job_.hasFailed = report.string(contract::kOVOP_ResultKey) == contract::kOVOP_FailKey.text();
}

// The repair does not wait for the lock, which only makes it less likely to be cut off.
void JobWatch::runBegan(const StartedRun& run)
{
    if (run.task.isRepair() || run.task.isUndo())
        wakefulness_.hold(
            at_.host.translator().sentence("Repairing “%@”", {contract::printable(run.disk)}));
    else
        wakefulness_.release();
    job_.reached.insert(run.identifier);
    job_.estimator = at_.host.makeTimeEstimator();
    job_.estimator->setStartTimeWithPercentComplete(at_.host.threads().now(), 0);
    disks_.list().synchronize();
    if (closer_.isEnding())
        closer_.stopAndClose();
    else if (job_.isStopAsked)
        at_.host.mainRunLoop().post([this] { at_.tabs.stopJob(); });
}

void JobWatch::runProgressed(const StartedRun& run)
{
    disks_.list().showProgress();
    at_.window.progress().setText(statusText(""));
    showProgress(run.percent);
}

// What a program's window and its place in the task bar show.
void JobWatch::showProgress(std::optional<double> percent)
{
    const QString name = QApplication::applicationDisplayName();
    at_.window.setWindowTitle(percent
                                  ? QStringLiteral("%1 – %2").arg(
                                        toQt(percentText(*percent, at_.host.translator())), name)
                                  : name);
    taskBar_.show(percent);
}

/// "2 of 9, big.img"
std::string JobWatch::placeOf(const StartedRun& run)
{
    const auto found = std::ranges::find_if(job_.disks, [&](const auto& disk) {
        return isAbout(run.identifier, disk->facts().identifier);
    });
    std::string place;
    if (job_.disks.size() > 1 && found != job_.disks.end())
        place = at_.host.translator().sentence("%ld of %ld",
                                               {static_cast<long>(found - job_.disks.begin()) + 1,
                                                static_cast<long>(job_.disks.size())});
    const auto disk = at_.host.sharedDiskController().diskNamed(run.identifier);
    const std::string bearer = disk ? disk->facts().path.filename().native() : std::string();
    if (!bearer.empty() && bearer != run.disk)
        place += (place.empty() ? "" : ", ") + contract::printable(bearer);
    return place;
}

std::string JobWatch::statusText(std::string_view moduleText)
{
    const StartedRun* const run = at_.ledger.currentRun();
    if (run == nullptr)
        return std::string(moduleText);
    const Translator& texts = at_.host.translator();
    std::string status = texts.sentence(statusKey(run->task), {contract::printable(run->disk)});
    if (const std::string place = placeOf(*run); !place.empty())
        status += " (" + place + ")";
    if (run->percent <= 0)
        return status;
    status += ", " + percentText(run->percent, texts);
    const std::string estimate =
        job_.estimator ? job_.estimator->timeEstimateString(run->percent) : std::string();
    return estimate.empty() ? status : status + ", " + estimate;
}

void JobWatch::runEnded(const StartedRun& run, const RunEnd& end)
{
    job_.runs.push_back({run, end});
    disks_.list().synchronize();
}

// While the job's images are attached, the module has no tool to stop: it has forgotten what it
// was to do, and waits for the images. They end at once.
void JobWatch::stopAsked()
{
    job_.isStopAsked = true;
    if (at_.ledger.currentRun() == nullptr)
        at_.host.imageAttachment().stopAttachments();
}

void JobWatch::end()
{
    wakefulness_.release();
    at_.tabs.forgetAction();
    showProgress(std::nullopt);
    at_.host.imageAttachment().resumeAttachments();
    const auto length = std::chrono::steady_clock::now() - job_.start;
    const auto runs = std::exchange(job_.runs, {});
    const bool isActive = QApplication::activeWindow() != nullptr;
    if (!runs.empty() && !closer_.isEnding() &&
        showsNotices.isOn(at_.host.standardUserDefaults()) &&
        isWorthANotice(length, isActive, longestGlanceAway_))
        notifier_.show(noticeOf(runs, at_.host.translator()));
    // Posted, because the module has not finished with the job when it gives the window free.
    at_.host.mainRunLoop().post([this] { lookBack(); });
}

void JobWatch::lookBack()
{
    if (at_.controller.interfaceLock())
        return;  // the next job has begun
    disks_.release();
    at_.controller.setSelection({});
    const bool isGivenUp = job_.isStopAsked || closer_.isEnding() || !job_.isCheck;
    auto sentences = isGivenUp ? std::vector<std::string>() : keepUnreachedImages();
    if (job_.hasFailed && !job_.isStopAsked && sentences.empty() && job_.reached.empty())
        sentences.push_back(text("Nothing that is selected could be checked."));
    disks_.refresh(job_.disks);
    disks_.list().synchronize();
    updated_();
    at_.host.showSheet(text("Not everything could be checked."), sentences);
}

bool JobWatch::hasResult() const
{
    return !job_.runs.empty() && std::ranges::none_of(job_.runs, [](const FinishedRun& finished) {
        return finished.end.errorCode == contract::kPLErrorDiskChanged;
    });
}

// Images that no tool got to see. The module has nothing to say about them.
std::vector<std::string> JobWatch::keepUnreachedImages()
{
    std::vector<std::string> sentences;
    for (const auto& disk : job_.disks) {
        const std::string& name = disk->facts().identifier;
        const auto inside = job_.reached.lower_bound(name);
        const bool isReached =
            inside != job_.reached.end() && (*inside == name || inside->starts_with(name + "#"));
        if (!disk->isOfflineDiskImage() || isReached)
            continue;
        sentences.push_back(whyUnreached(at_.host, *disk, disk->displayName()));
        const bool isRepair = job_.action.starts_with("repair");
        keepUnreached(at_.host, *disk,
                      isRepair ? pellar::Operation::Repair : pellar::Operation::Verify,
                      sentences.back());
    }
    return sentences;
}

}  // namespace orvane::desktop
