// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/DesktopHost.h"
#include "orvane/desktop/window/WindowController.h"
#include "orvane/jobs/LibraryTexts.h"
#include "orvane/jobs/ObservedManager.h"
#include "orvane/support/modules/ModuleLoader.h"
#include "pellar/Manager.h"

#include <memory>
#include <string>

namespace orvane::desktop {

/// One module and its place in the window. Main thread.
class ModuleTab final : private contract::ModuleSite {
public:
    /// All outlive the tab.
    struct Surroundings {
        DesktopHost& host;
        WindowController& window;
        JobObserver& jobs;
        pellar::JobOptions libraryOptions;
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
    void stopHarder() { observedLibrary_.cancelAgain(); }

private:
    Result<void, Failure> makeModule();

    bool isActiveTab() const override { return isActive_; }
    contract::OVWindowController& windowController() override { return window_; }
    contract::OVDiskPointer workingDisk() const override;
    contract::Window& window() override { return window_; }
    contract::Bundle& bundle() override { return *loaded_.bundle; }
    contract::PLManager& pl() override { return observedLibrary_; }

    DesktopHost& host_;
    WindowController& window_;
    LoadedModule loaded_;
    LibraryTexts libraryTexts_;
    pellar::Manager library_;
    ObservedManager observedLibrary_;
    std::unique_ptr<contract::OVModule> module_;
    LoadedInterface* interface_ = nullptr;  ///< of the host's loader
    bool isActive_ = false;
};

}  // namespace orvane::desktop
