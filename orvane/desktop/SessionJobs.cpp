// SPDX-License-Identifier: Apache-2.0
// What a job means beyond its tab: for the list, the disks it works on, and the user's session.

#include "fixwell/host/foundation/UTF8.h"
#include "orvane/desktop/DesktopEntry.h"
#include "orvane/desktop/DesktopSession.h"

#include <QApplication>

#include <utility>

namespace orvane::desktop {

JobLedger::Events DesktopSession::ledgerEvents()
{
    return {[this](const StartedRun& run) { runBegan(run); },
            [this](const StartedRun& run, const RunEnd& end) {
                runEnded(run, end);
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
    if (writes(run.operation))
        wakefulness_.hold(
            host_.translator().sentence("Repairing “%@”", {fixwell::printable(run.disk)}));
    else
        wakefulness_.release();
    if (isEnding_)
        stopAndClose();
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
    holdDisks();
}

void DesktopSession::jobEnded()
{
    wakefulness_.release();
    const auto length = std::chrono::steady_clock::now() - jobStart_;
    const auto runs = std::exchange(finishedRuns_, {});
    const bool isActive = QApplication::activeWindow() != nullptr;
    if (!runs.empty() && !isEnding_ && isWorthANotice(length, isActive, options_.longestGlanceAway))
        notifier_.show(noticeOf(runs, host_.translator()));
    // Posted, because the module has not finished with the job when it gives the window free.
    loop_.post([this] { releaseDisks(); });
}

}  // namespace orvane::desktop
