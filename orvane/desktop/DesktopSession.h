// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/DesktopHost.h"
#include "orvane/desktop/DiskScan.h"
#include "orvane/desktop/ImageOpener.h"
#include "orvane/desktop/JobLedger.h"
#include "orvane/desktop/ModuleTab.h"
#include "orvane/desktop/session/DesktopNotifier.h"
#include "orvane/desktop/session/SleepInhibitor.h"
#include "orvane/desktop/window/DiskTreeModel.h"
#include "orvane/desktop/window/MainWindow.h"
#include "orvane/desktop/window/Menus.h"
#include "orvane/desktop/window/WindowController.h"
#include "orvane/support/disks/DiskWatch.h"
#include "orvane/support/modules/ModuleSearch.h"

#include <QMessageBox>

#include <chrono>
#include <functional>
#include <map>
#include <memory>
#include <set>
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
    std::function<void()> closed;  ///< the window is closed for good
};

/// One run of the program: the host, the modules and the window, and what the window's commands do
/// with them. Main thread; one at a time, with the application object there before and after.
class DesktopSession {
public:
    explicit DesktopSession(SessionOptions options);
    DesktopSession(const DesktopSession&) = delete;
    DesktopSession& operator=(const DesktopSession&) = delete;
    ~DesktopSession();

    /// Shows the window; disks are looked for once it is on the screen.
    void show();
    /// Ends the program in order, unasked; a job that runs is stopped first. Asked again, the job
    /// is stopped harder.
    void end();

    MainWindow& window() { return window_; }
    DesktopHost& host() { return host_; }
    /// The tab that is shown; none when there is no module.
    ModuleTab* activeTab();

private:
    SupportOptions supportOptions();
    pellar::JobOptions libraryOptions();
    DiskStates diskStates();
    std::optional<LastCheck> lastCheckOf(const Disk& disk);
    std::string activityOn(const Disk& disk);
    void observeDisks();
    void watchSystemDisks();
    void disksRead(const std::vector<DiskTree>& disks);
    void openNamed(bool areFiles);
    void holdDisks();
    void releaseDisks();
    void connectWindow();

    void loadModules();
    void addTab(std::unique_ptr<ModuleTab> tab);
    void updateTabs();
    void selectionChanged();
    void refreshHints();
    void tellEmptyText();
    void tellReasons();
    std::string reasonFor(const Disk& disk, std::string_view button);
    std::map<std::string, std::string> reasonsByDisk();
    std::string emptyText();
    void windowAppeared();

    std::vector<Menu> menus();
    void chooseImages(std::string_view title,
                      const std::function<void(const std::vector<std::string>&)>& chosen);
    void attachAsDevices(const std::vector<std::string>& images);
    void carryOut(std::vector<DiskRequest> requests);
    std::vector<DiskRequest> requestsFor(DiskAction action);
    bool canDo(DiskAction action);
    void doToSelection(DiskAction action);
    MenuCommand diskCommand(const char* objectName, std::string_view title, QKeySequence shortcut,
                            DiskAction action);
    contract::OutlineView* log();
    void reloadLog();
    void completeLog();
    std::string selectionHTML();
    bool canEdit(contract::Selector action);
    bool fetchesArchives();
    void switchArchiveFetching();
    void undoClearing();
    void showDiskMenu(const QPoint& place);
    QtButton* moduleButton(const char* name);
    MenuCommand buttonCommand(const char* objectName, std::string_view title, const char* button);
    MenuCommand mapCommand(const char* objectName, std::string_view title, const char* button);
    std::shared_ptr<Disk> diskWithMap();
    void treatMap(const char* button);
    bool isInDiskList() const;
    void selectAll();
    QtButton* detailsButton();

    bool mayClose();
    void askWhetherToStop();
    void stopAndClose();
    void stopJob();
    void lockChanged(bool isLocked);

    JobLedger::Events ledgerEvents();
    DesktopNotifier::Options notifierOptions();
    void runBegan(const StartedRun& run);
    void runEnded(const StartedRun& run, const RunEnd& end);
    void stopAsked();
    void jobBegan();
    void jobEnded();
    void lookBackAtJob();
    std::vector<std::string> keepUnreachedImages();

    void warn(const std::string& sentence);
    static std::string joined(const std::vector<std::string>& sentences);
    void showWarnings();
    void showFailures(const std::vector<std::string>& sentences);
    std::string text(std::string_view key) { return host_.translator().text(key); }

    const SessionOptions options_;
    std::vector<std::string> warnings_;  ///< not shown yet
    bool hasAppeared_ = false;
    bool hasReadDisks_ = false;
    bool isEnding_ = false;
    bool areHintsAwaited_ = false;

    QtLoop loop_;
    Catalogue hostTexts_;
    LibraryTexts libraryTexts_;
    pellar::Manager library_;  ///< answers what the tools can do; runs no jobs
    DesktopHost host_;
    MainWindow window_;
    DiskTreeModel disks_;
    WindowController controller_;
    JobLedger jobs_;
    ImageOpener images_;
    std::vector<std::unique_ptr<ModuleTab>> tabs_;  ///< in the order of the window's tabs
    DiskScan scan_;
    DiskWatch watch_{loop_, [this] {
                         scan_.start();
                     }};
    QPointer<QMessageBox> question_;

    SleepInhibitor wakefulness_{options_.buses.system};
    DesktopNotifier notifier_{notifierOptions()};
    std::chrono::steady_clock::time_point jobStart_;
    std::vector<FinishedRun> finishedRuns_;  ///< of the job that runs

    /// The job that runs, or ran last.
    struct Job {
        std::string action;                        ///< the selector that began it
        std::vector<std::shared_ptr<Disk>> disks;  ///< that it was to work on
        std::set<std::string> reached;             ///< identifiers of disks that a run was about
        bool isStopAsked = false;
        bool hasFailed = false;  ///< by the module's own report
    };
    Job job_;
    std::string lastAction_;
};

}  // namespace orvane::desktop
