// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/OVWindowController.h"
#include "contract/toolkit/Control.h"
#include "orvane/desktop/window/MainWindow.h"

#include <functional>

namespace orvane::desktop {

/// What the modules see of the window. Main thread; the window must outlive it.
class WindowController final : public contract::OVWindowController, public contract::Window {
public:
    struct Events {
        std::function<void(bool isLocked)> lockChanged;
        std::function<void(const contract::Dictionary& report)> completed;
        /// What the status line says where a module wants this to be said.
        std::function<std::string(std::string_view text)> statusText;
    };

    explicit WindowController(MainWindow& window) : window_(window) {}
    void setEvents(Events events) { events_ = std::move(events); }

    using Disks = std::vector<contract::OVDiskPointer>;
    /// The modules see these as the selection, whatever the list shows, until none are given.
    void setSelection(Disks disks) { selection_ = std::move(disks); }

    std::vector<contract::OVDiskPointer> allSelectedItemsFilterDuplicates(
        bool flag, bool filtersDuplicates) override;
    void setInterfaceLock() override { setLocked(true); }
    void resetInterfaceLock() override { setLocked(false); }
    bool interfaceLock() const override { return isLocked_; }
    void activateGlobalProgressBar(bool isActive) override;
    void activateGlobalProgressText(bool isActive) override;
    void setGlobalProgressBarIndeterminate(bool isIndeterminate) override;
    /// The bar moves by itself whenever there is no telling how far a job is.
    void startGlobalProgressBarAnimation(const void* /*sender*/) override {}
    void setGlobalProgressBarValue(double percent) override;
    void setGlobalProgressText(std::string_view text) override;
    void notifyWindowOfCompletion(const contract::Dictionary& report) override;
    bool isMainWindow() const override { return window_.hasAttention(); }

private:
    void setLocked(bool isLocked);

    MainWindow& window_;
    Events events_;
    Disks selection_;  ///< in place of the list's
    bool isLocked_ = false;
};

}  // namespace orvane::desktop
