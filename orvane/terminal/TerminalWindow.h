// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/OVWindowController.h"
#include "contract/toolkit/Control.h"

#include <functional>
#include <optional>
#include <string>

namespace orvane {

/// What a window is to a module, for a program that has none: a selection, progress and a status
/// text, and the word that a job is over.
class TerminalWindow final : public contract::OVWindowController, public contract::Window {
public:
    struct Events {
        std::function<void()> progressChanged;
        std::function<void(const contract::Dictionary& report)> completed;
    };

    void setEvents(Events events) { events_ = std::move(events); }
    void select(std::vector<contract::OVDiskPointer> disks) { selection_ = std::move(disks); }
    /// From 0 to 100; none while there is no telling.
    std::optional<double> percent() const
    {
        return isIndeterminate_ ? std::nullopt : std::optional(percent_);
    }
    const std::string& status() const { return status_; }

    std::vector<contract::OVDiskPointer> allSelectedItemsFilterDuplicates(bool, bool) override
    {
        return selection_;
    }
    void setInterfaceLock() override { isLocked_ = true; }
    void resetInterfaceLock() override { isLocked_ = false; }
    bool interfaceLock() const override { return isLocked_; }
    void activateGlobalProgressBar(bool /*isActive*/) override {}
    void activateGlobalProgressText(bool /*isActive*/) override {}
    void setGlobalProgressBarIndeterminate(bool isIndeterminate) override
    {
        isIndeterminate_ = isIndeterminate;
    }
    void startGlobalProgressBarAnimation(const void* /*sender*/) override {}
    void setGlobalProgressBarValue(double percent) override
    {
        percent_ = percent;
        changed();
    }
    void setGlobalProgressText(std::string_view text) override
    {
        status_ = text;
        changed();
    }
    void notifyWindowOfCompletion(const contract::Dictionary& report) override
    {
        if (events_.completed)
            events_.completed(report);
    }
    bool isMainWindow() const override { return true; }

private:
    void changed() const
    {
        if (isLocked_ && events_.progressChanged)
            events_.progressChanged();
    }

    Events events_;
    std::vector<contract::OVDiskPointer> selection_;
    bool isLocked_ = false;
    bool isIndeterminate_ = true;
    double percent_ = 0;
    std::string status_;
};

}  // namespace orvane
