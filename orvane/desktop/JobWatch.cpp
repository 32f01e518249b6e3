// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/JobWatch.h"

#include "contract/foundation/UTF8.h"
#include "orvane/jobs/UnavailableReason.h"

#include <QApplication>

#include <utility>

namespace orvane::desktop {

JobWatch::JobWatch(const SessionParts& parts, DiskPane& disks, WindowCloser& closer,
                   const SessionBuses& buses, std::chrono::milliseconds glance,
                   std::function<void()> updated)
    : at_(parts),
      disks_(disks),
      closer_(closer),
      longestGlanceAway_(glance),
      updated_(std::move(updated)),
      wakefulness_(buses.system),
      notifier_({buses.session, desktopEntry, text("Show"), [this] {
                     QWidget& window = at_.window;
                     window.setWindowState(window.windowState() & ~Qt::WindowMinimized);
                     window.raise();
                     window.activateWindow();
                 }})
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
    disks_.list().synchronize();
    if (closer_.isEnding())
        closer_.stopAndClose();
    else if (job_.isStopAsked)
        at_.host.mainRunLoop().post([this] { at_.tabs.stopJob(); });
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
    at_.host.imageAttachment().resumeAttachments();
    const auto length = std::chrono::steady_clock::now() - job_.start;
    const auto runs = std::exchange(job_.runs, {});
    const bool isActive = QApplication::activeWindow() != nullptr;
    if (!runs.empty() && !closer_.isEnding() &&
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
    const bool isGivenUp = job_.isStopAsked || closer_.isEnding();
    auto sentences = isGivenUp ? std::vector<std::string>() : keepUnreachedImages();
    if (job_.hasFailed && !job_.isStopAsked && sentences.empty() && job_.reached.empty())
        sentences.push_back(text("Nothing that is selected could be checked."));
    disks_.refresh(job_.disks);
    disks_.list().synchronize();
    updated_();
    at_.host.showSheet(text("Not everything could be checked."), sentences);
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
