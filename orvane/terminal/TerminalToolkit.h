// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/OVWindowController.h"
#include "contract/toolkit/Control.h"
#include "contract/toolkit/Interface.h"
#include "orvane/terminal/LogView.h"

#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace orvane {

/// A button without a screen: a command presses it, or reads the reason why it cannot.
class TerminalButton final : public contract::Button {
public:
    void setNeedsDisplay(bool /*needsDisplay*/) override {}
    void setEnabled(bool isEnabled) override { isEnabled_ = isEnabled; }
    bool isEnabled() const override { return isEnabled_; }
    void setToolTip(std::string_view /*text*/) override {}
    void setTitle(std::string_view title) override { title_ = title; }
    void setAction(contract::Selector action) override { action_ = action; }
    void setIntegerValue(std::int64_t /*value*/) override {}
    void setKeyEquivalent(std::string_view /*key*/) override {}
    void setTag(std::int64_t tag) override { tag_ = tag; }
    void setReason(std::string_view reason) override { reason_ = reason; }

    const std::string& title() const { return title_; }
    const std::string& reason() const { return reason_; }
    contract::Selector action() const { return action_; }
    std::int64_t tag() const { return tag_; }

private:
    bool isEnabled_ = true;
    std::string title_;
    std::string reason_;
    contract::Selector action_;
    std::int64_t tag_ = 0;
};

/// Text beside the controls. That of the checking module, beside its log, is not shown: a terminal
/// has its help instead.
class TerminalTextField final : public contract::TextField {
public:
    void setNeedsDisplay(bool /*needsDisplay*/) override {}
    void setEnabled(bool isEnabled) override { isEnabled_ = isEnabled; }
    bool isEnabled() const override { return isEnabled_; }
    void setToolTip(std::string_view /*text*/) override {}
    void setAttributedStringValue(const contract::StyledText& text) override
    {
        text_ = text.characters();
    }

    const std::string& text() const { return text_; }

private:
    bool isEnabled_ = true;
    std::string text_;
};

class TerminalTextView final : public contract::TextView {
public:
    void setNeedsDisplay(bool /*needsDisplay*/) override {}
    void setString(std::string_view text) override { text_ = text; }

    const std::string& text() const { return text_; }

private:
    std::string text_;
};

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
    const std::vector<contract::OVDiskPointer>& selection() const { return selection_; }
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

/// A module's interface on a terminal: for each outlet a control without a screen, and the log's
/// rows on standard output. The controls are pressed by commands.
class TerminalInterface final : public contract::InterfaceLoader {
public:
    explicit TerminalInterface(LogView& logView) : logView_(logView) {}

    bool loadInterface(std::string_view name, contract::InterfaceOwner& owner) override;
    void disconnect(contract::InterfaceOwner& owner) override;

    /// One that does nothing where the module has no such outlet.
    TerminalButton& button(std::string_view outlet);
    /// Sends the button's action to the module, as a click would; NO when the button is disabled.
    bool press(TerminalButton& button);
    /// The button that stops the module's job now; none when there is none that can be pressed.
    TerminalButton* stopButton();

    /// What the module shows, by the names of its outlets, in their order: all but the log's rows.
    std::vector<std::pair<std::string, std::string>> texts() const;
    std::vector<std::pair<std::string, const TerminalButton*>> buttons() const;

private:
    void connect(const contract::Outlet& outlet, contract::InterfaceOwner& owner);

    LogView& logView_;
    contract::InterfaceOwner* owner_ = nullptr;
    std::vector<std::string> names_;  ///< of the outlets
    std::map<std::string, TerminalButton, std::less<>> buttons_;
    TerminalButton missingButton_;
    std::map<std::string, TerminalTextField, std::less<>> textFields_;
    std::map<std::string, TerminalTextView, std::less<>> textViews_;
    std::unique_ptr<contract::OutlineView> outlineView_;
};

}  // namespace orvane
