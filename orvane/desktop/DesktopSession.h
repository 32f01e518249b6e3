// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/DiskOverview.h"
#include "orvane/desktop/HistoryWatch.h"
#include "orvane/desktop/JobWatch.h"
#include "orvane/desktop/MenuCommands.h"
#include "orvane/desktop/ModuleHints.h"
#include "orvane/desktop/RepairChoices.h"
#include "orvane/desktop/RepairUndoing.h"
#include "orvane/privileges/LibraryOptions.h"
#include "orvane/support/modules/ModuleSearch.h"

#include <QDesktopServices>

#include <chrono>
#include <functional>
#include <string>
#include <vector>

namespace orvane::desktop {

struct SessionOptions {
    XDGPaths paths = userXDGPaths();
    std::vector<std::filesystem::path> moduleDirectories =
        orvane::moduleDirectories(environmentValue, runningExecutable());
    std::vector<std::string> disksToOpen;  ///< as orvane/support/disks/DiskLookup.h takes them
    bool scansSystemDisks = true;
    pellar::OutputLimits outputLimits;
    SessionBuses buses;
    std::chrono::milliseconds longestGlanceAway = desktop::longestGlanceAway;
    /// Opens a directory where no file manager answers on the bus.
    std::function<bool(const QUrl& directory)> openDirectory = QDesktopServices::openUrl;
    std::function<void()> closed;  ///< the window is closed for good
};

/// One run of the program: makes the host, the modules, the window and what goes on in it, and
/// connects them. Main thread; one at a time, with the application object there before and after.
class DesktopSession {
public:
    explicit DesktopSession(SessionOptions options);
    DesktopSession(const DesktopSession&) = delete;
    DesktopSession& operator=(const DesktopSession&) = delete;
    ~DesktopSession();

    /// Shows the window; disks are looked for once it is on the screen.
    void show() { window_.show(); }
    /// Brings the window to the front.
    void present();
    /// Opens further disks, as the command line names them; while a job runs, when it is over.
    void open(const std::vector<std::string>& names);
    /// Ends the program in order, unasked; a job that runs is stopped first. Asked again, the job
    /// is stopped harder.
    void end() { closer_.end(); }

    MainWindow& window() { return window_; }
    DesktopHost& host() { return host_; }
    /// The tab that is shown; none when there is no module.
    ModuleTab* activeTab() { return tabs_.active(); }

private:
    SessionParts parts() { return {host_, window_, controller_, tabs_, ledger_}; }
    SupportOptions supportOptions();
    pellar::JobOptions libraryOptions();
    pellar::JobOptions observedOptions();
    RepairAdvice repairAdvice();
    JobLedger::Events ledgerEvents();
    void loadModules();
    void connectWindow();
    void connectHost();

    void runEnded(const StartedRun& run, const RunEnd& end);
    void lockChanged(bool isLocked);
    void update();
    void selectionChanged();
    void windowAppeared();
    void takeInHistories();
    void warn(const std::string& sentence);
    void showWarnings();

    const SessionOptions options_;
    pellar::RepairPolicy jobPolicy_;     ///< of the job at hand
    std::vector<std::string> warnings_;  ///< not shown yet
    std::vector<std::string> toOpen_;    ///< when the job is over
    bool hasAppeared_ = false;

    QtLoop loop_;
    Catalogue hostTexts_;
    LibraryTexts libraryTexts_;
    pellar::Manager library_;  ///< answers what the tools can do; runs no jobs
    DesktopHost host_;
    MainWindow window_;
    WindowController controller_;
    JobLedger ledger_;
    ModuleTabs tabs_;
    KeptRepairs repairs_;
    DiskPane disks_;
    ModuleHints hints_;
    WindowCloser closer_;
    JobWatch jobs_;
    RepairUndoing undoing_;
    RepairChoices choices_;
    DiskOverview overview_;
    FileManager files_;
    DiskCommands diskCommands_;
    WindowDialogs dialogs_;
    MenuCommands commands_;
    HistoryWatch histories_;
};

}  // namespace orvane::desktop
