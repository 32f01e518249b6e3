// SPDX-License-Identifier: Apache-2.0
// How a session presses the module's buttons, and follows and stops the jobs that come of it.

#include "orvane/support/loop/SignalReader.h"
#include "orvane/terminal/Session.h"

#include <poll.h>

#include <algorithm>
#include <utility>

namespace orvane {
namespace {

/// Calls back on the main thread for each signal that would end the program, from this object's
/// making until its end. No thread may be running when it is made. The loop outlives it.
class Interrupts {
public:
    Interrupts(MainLoop& loop, std::function<void()> interrupted)
        : loop_(loop), interrupted_(std::move(interrupted))
    {
        if (signals_.descriptor() >= 0)
            loop_.watch(signals_.descriptor(), POLLIN, [this](short) {
                while (signals_.take())
                    interrupted_();
            });
    }
    Interrupts(const Interrupts&) = delete;
    Interrupts& operator=(const Interrupts&) = delete;
    ~Interrupts()
    {
        if (signals_.descriptor() >= 0)
            loop_.unwatch(signals_.descriptor());
    }

private:
    SignalReader signals_;
    MainLoop& loop_;
    std::function<void()> interrupted_;
};

}  // namespace

void Session::select(const std::vector<DiskPointer>& disks)
{
    logView_.holdBack();
    window_.select({disks.begin(), disks.end()});
    module_->windowChangedNotication({contract::OVDiskChangedNotification, nullptr, {}});
}

// The disk list of a window would keep its selection; here the log goes with the disk that is
// being worked on, so that its rows come one after the other.
void Session::follow(const contract::DiskReferencePointer& reference)
{
    if (const auto disk =
            std::dynamic_pointer_cast<Disk>(host_.sharedDiskController().diskWithKRDisk(reference)))
        select({disk});
    logView_.followFromLastRow();
    if (isStopping_)
        loop_.post([this] { pressStop(); });
}

void Session::pressAndWait(TerminalButton& button)
{
    // Before, an interruption just ends the program: there is nothing yet to be ended in order.
    const Interrupts interrupts(loop_, [this] { interrupt(); });
    if (!interface_.press(button))
        return;
    loop_.runUntil([this] { return !window_.interfaceLock() && !alerts_.isAsking(); });
    reportEnd();
    host_.histories().saveNew();
}

// Progress and the interface's lock are the window's, as in a module's job.
RunEnd Session::carryOut(pellar::Task task, const DiskPointer& disk)
{
    const Interrupts interrupts(loop_, [this] { interrupt(); });
    HostJob job(library_, host_, disk,
                {[this] { logView_.reloadData(); },
                 [this](double percent) {
                     window_.setGlobalProgressBarIndeterminate(false);
                     window_.setGlobalProgressBarValue(percent);
                 }});
    host_.sharedDiskController().hold({disk});
    window_.setInterfaceLock();
    window_.setGlobalProgressBarIndeterminate(true);
    window_.setGlobalProgressText(HostJob::titleOf(task, *disk, host_.translator()));
    hostJob_ = &job;
    job.begin(task);
    loop_.runUntil([&job] { return job.isOver(); });
    hostJob_ = nullptr;
    window_.resetInterfaceLock();
    reportEnd();
    host_.histories().saveNew();
    host_.sharedDiskController().release();
    repairRecords_.reset();
    return outcomes_[disk->facts().identifier];
}

void Session::writeAllRowsOf(const std::string& name)
{
    currentDisk_ = name;
    host_.histories().loadAll();
    logView_.writeAllRows();
}

// The first interruption is the Stop button. A job whose images are still being attached has none
// that works; the attaching ends, and should the job begin all the same, it is stopped then. Every
// further interruption presses the tool harder.
void Session::interrupt()
{
    reporter_.prompt(Reporter::Prompt::Left);
    const bool isFirst = !isStopping_;
    isStopping_ = true;
    if (hostJob_ != nullptr)
        hostJob_->stop();
    else if (!isFirst)
        library_.cancelAgain();
    else if (!pressStop())
        host_.imageAttachment().stopAttachments();
}

bool Session::pressStop()
{
    // What another module does is known by its button alone: it runs no job of the library's.
    if (currentDisk_.empty() && isChecking())
        return false;
    TerminalButton* const stop = interface_.stopButton();
    return stop != nullptr && interface_.press(*stop);
}

TerminalWindow::Events Session::windowEvents()
{
    return {[this] {
                if (ledger_.currentRun() != nullptr || !isChecking())
                    reporter_.progress(currentDisk_, window_.percent(), window_.status());
            },
            [this](const contract::Dictionary& report) {
                reportEnd();
                reporter_.report(names_.nameOf(report.string(contract::kOVOP_DiskIdentifierKey)),
                                 report);
            }};
}

void Session::jobBegan(const StartedRun& run, const contract::DiskReferencePointer& disk)
{
    reportEnd();
    currentDisk_ = names_.nameOf(run.identifier);
    reporter_.started(currentDisk_, nameOf(run.task), window_.status());
    follow(disk);
}

// The module's last rows are still to come, so the end is not reported here.
void Session::jobEnded(const StartedRun& run, const RunEnd& end)
{
    unreportedEnd_ = end;
    outcomes_[run.identifier] = end;
}

void Session::reportEnd()
{
    logView_.flush();
    if (const auto end = std::exchange(unreportedEnd_, std::nullopt))
        reporter_.finished(currentDisk_, end->verdict, end->errorCode, end->message);
}

}  // namespace orvane
