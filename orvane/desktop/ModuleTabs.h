// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/DesktopHost.h"
#include "orvane/desktop/window/WindowController.h"
#include "orvane/jobs/JobLedger.h"
#include "orvane/jobs/LibraryTexts.h"
#include "orvane/support/modules/ModuleLoader.h"
#include "pellar/Manager.h"

#include <filesystem>
#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace orvane::desktop {

/// One module and its place in the window. Main thread.
class ModuleTab final : private contract::ModuleSite {
public:
    /// All outlive the tab.
    struct Surroundings {
        DesktopHost& host;
        WindowController& window;
        const pellar::JobOptions& libraryOptions;
    };

    /// Loads the bundle's module, unless it is switched off in the settings: then there is no tab.
    [[nodiscard]] static Result<std::unique_ptr<ModuleTab>, Failure> load(
        const std::filesystem::path& bundle, const Surroundings& surroundings);
    ModuleTab(const Surroundings& surroundings, LoadedModule loaded);
    ModuleTab(const ModuleTab&) = delete;
    ModuleTab& operator=(const ModuleTab&) = delete;
    /// Ends the module, its running job with it.
    ~ModuleTab() override;

    contract::OVModule& module() { return *module_; }
    /// None when the module has no interface file.
    LoadedInterface* interface() { return interface_; }

    /// Whether the tab is the one that is shown. The module hears of the selection when it is.
    void setActive(bool isActive) { isActive_ = isActive; }
    void tellOfSelection();
    /// The host's word to the modules that are shown.
    void deliver(const contract::Notification& notification);
    /// Whether the tab is offered for what is selected.
    bool isOffered();

    /// Presses the module's Stop button; NO when there is nothing that can be stopped now.
    bool stopJob();
    /// Presses the job that is being stopped harder.
    void stopHarder() { library_.cancelAgain(); }

private:
    Result<void, Failure> makeModule();

    bool isActiveTab() const override { return isActive_; }
    contract::OVWindowController& windowController() override { return window_; }
    contract::OVDiskPointer workingDisk() const override;
    contract::Window& window() override { return window_; }
    contract::Bundle& bundle() override { return *loaded_.bundle; }
    contract::PLManager& pl() override { return library_; }

    DesktopHost& host_;
    WindowController& window_;
    LoadedModule loaded_;
    LibraryTexts libraryTexts_;
    pellar::Manager library_;
    std::unique_ptr<contract::OVModule> module_;
    LoadedInterface* interface_ = nullptr;  ///< of the host's loader
    bool isActive_ = false;
};

/// The modules' tabs, in the order of the window's. Main thread.
class ModuleTabs {
public:
    /// All outlive the tabs.
    ModuleTabs(DesktopHost& host, MainWindow& window, WindowController& controller)
        : host_(host), window_(window), controller_(controller)
    {
    }

    /// Loads the modules of the bundles, and tells of each that cannot be loaded. Where none is
    /// left, a tab says so.
    void load(const std::vector<std::filesystem::path>& bundles,
              const pellar::JobOptions& libraryOptions, const WarningSink& warn);
    /// The modules end, their running job with them.
    void clear() { tabs_.clear(); }

    /// The tab that is shown; none when there is no module.
    ModuleTab* active();
    /// Settles which tab is shown, and has its module look at what is selected.
    void update();
    /// Enables the tabs that are offered for what is selected.
    void offer();
    /// Asked before a module performs an action that the user asks for.
    void setMayPerform(std::function<bool(std::string_view action)> asked)
    {
        mayPerform_ = std::move(asked);
    }
    /// Where there is little room.
    void setCompact(bool isCompact);
    /// Stops the job that runs: the host's own or, of a module, by its Stop button or, where that
    /// cannot be pressed, by itself.
    void stopJob();
    /// How the host's own job is stopped while it runs, and pressed harder; empty when none does.
    void setStopOfHostJob(std::function<void()> stop) { stopHostJob_ = std::move(stop); }
    void stopHarder();

    // Of the tab that is shown; none when there is no such thing.

    LoadedInterface* interface();
    QtButton* button(std::string_view outlet);
    contract::OutlineView* log();
    /// Shows the log as it is now.
    void reloadLog();
    std::string selectedLogHTML();
    std::string selectedLogText();

    /// The selector that a module performed last, with the window free; empty behind its job.
    const std::string& lastAction() const { return lastAction_; }
    void forgetAction() { lastAction_.clear(); }
    /// It was none of another module's, which does no checks.
    bool lastActionIsCheck() const;

private:
    void add(std::unique_ptr<ModuleTab> tab);
    void addEmptyTab(const std::string& switchedOff);

    DesktopHost& host_;
    MainWindow& window_;
    WindowController& controller_;
    std::vector<std::unique_ptr<ModuleTab>> tabs_;
    std::string lastAction_;
    std::function<bool(std::string_view action)> mayPerform_;
    std::function<void()> stopHostJob_;
};

/// What the parts of a session work with; all outlive them.
struct SessionParts {
    DesktopHost& host;
    MainWindow& window;
    WindowController& controller;
    ModuleTabs& tabs;
    const JobLedger& ledger;
};

}  // namespace orvane::desktop
