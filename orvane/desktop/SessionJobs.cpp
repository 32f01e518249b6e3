// SPDX-License-Identifier: Apache-2.0
// What a job means beyond its tab: for the list, the disks it works on, and the user's session.

#include "contract/foundation/UTF8.h"
#include "orvane/desktop/DesktopEntry.h"
#include "orvane/desktop/DesktopSession.h"
#include "orvane/jobs/UnavailableReason.h"

#include <QApplication>

#include <utility>

namespace orvane::desktop {

JobLedger::Events DesktopSession::ledgerEvents()
{
    return {[this](const StartedRun& run, const contract::DiskReferencePointer&) { runBegan(run); },
            [this](const StartedRun& run, const RunEnd& end) { runEnded(run, end); },
            [this] {
                stopAsked();
            }};
}

DesktopNotifier::Options DesktopSession::notifierOptions()
{
    return {options_.buses.session, desktopEntry, text("Show"), [this] {
                window_.setWindowState(window_.windowState() & ~Qt::WindowMinimized);
                window_.raise();
                window_.activateWindow();
            }};
}

// The repair does not wait for the lock, which only makes it less likely to be cut off.
void DesktopSession::runBegan(const StartedRun& run)
{
    if (run.isRepair())
        wakefulness_.hold(
            host_.translator().sentence("Repairing “%@”", {contract::printable(run.disk)}));
    else
        wakefulness_.release();
    job_.reached.insert(run.identifier);
    window_.disks().synchronize();
    if (isEnding_)
        stopAndClose();
    else if (job_.isStopAsked)
        loop_.post([this] { stopJob(); });
}

// While the job's images are attached, the module has no tool to stop: it has forgotten what it
// was to do, and waits for the images. They end at once.
void DesktopSession::stopAsked()
{
    job_.isStopAsked = true;
    if (jobs_.currentRun() == nullptr)
        host_.imageAttachment().stopAttachments();
}

void DesktopSession::runEnded(const StartedRun& run, const RunEnd& end)
{
    finishedRuns_.push_back({run, end});
    window_.disks().synchronize();
}

// A job is all that is done while the window is locked, be it on one disk or on many.
void DesktopSession::jobBegan()
{
    jobStart_ = std::chrono::steady_clock::now();
    finishedRuns_.clear();
    job_ = {lastAction_, window_.disks().selectedDisks(), {}, false, false};
    holdDisks();
    refreshHints();
}

void DesktopSession::jobEnded()
{
    wakefulness_.release();
    host_.imageAttachment().resumeAttachments();
    const auto length = std::chrono::steady_clock::now() - jobStart_;
    const auto runs = std::exchange(finishedRuns_, {});
    const bool isActive = QApplication::activeWindow() != nullptr;
    if (!runs.empty() && !isEnding_ && isWorthANotice(length, isActive, options_.longestGlanceAway))
        notifier_.show(noticeOf(runs, host_.translator()));
    // Posted, because the module has not finished with the job when it gives the window free.
    loop_.post([this] { lookBackAtJob(); });
}

void DesktopSession::lookBackAtJob()
{
    releaseDisks();
    if (controller_.interfaceLock())
        return;  // the next job has begun
    controller_.setSelection({});
    auto sentences =
        job_.isStopAsked || isEnding_ ? std::vector<std::string>() : keepUnreachedImages();
    if (job_.hasFailed && !job_.isStopAsked && sentences.empty() && job_.reached.empty())
        sentences.push_back(text("Nothing that is selected could be checked."));
    for (const auto& disk : job_.disks)
        images_.refresh(*disk);
    window_.disks().synchronize();
    updateTabs();
    if (!sentences.empty())
        host_.alerts().simpleModuleAlert(text("Not everything could be checked."),
                                         joined(sentences), 0);
}

// Images that no tool got to see. The module has nothing to say about them.
std::vector<std::string> DesktopSession::keepUnreachedImages()
{
    std::vector<std::string> sentences;
    for (const auto& disk : job_.disks) {
        const std::string& name = disk->facts().identifier;
        const auto inside = job_.reached.lower_bound(name);
        const bool isReached =
            inside != job_.reached.end() && (*inside == name || inside->starts_with(name + "#"));
        if (!disk->isOfflineDiskImage() || isReached)
            continue;
        sentences.push_back(whyUnreached(host_, *disk, disk->displayName()));
        const bool isRepair = job_.action.starts_with("repair");
        keepUnreached(host_, *disk, isRepair ? pellar::Operation::Repair : pellar::Operation::Verify,
                      sentences.back());
    }
    return sentences;
}

}  // namespace orvane::desktop
