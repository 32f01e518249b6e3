// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/SupportHost.h"
#include "orvane/support/loop/MainLoop.h"
#include "orvane/terminal/Interface.h"
#include "orvane/terminal/TerminalAlerts.h"

#include <optional>

namespace orvane {

/// Preferences as stored, but for what the command line says for this once.
class RequestedPreferences final : public fixwell::OVPreferences {
public:
    RequestedPreferences(fixwell::OVPreferences& stored, std::optional<bool> showsDetails)
        : stored_(stored), showsDetails_(showsDetails)
    {
    }

    bool showDetailsInFixwell() const override
    {
        return showsDetails_ ? *showsDetails_ : stored_.showDetailsInFixwell();
    }
    void setShowDetailsInFixwell(bool shows) override
    {
        showsDetails_.reset();
        stored_.setShowDetailsInFixwell(shows);
    }
    bool rootVolumeIsReadOnly() const override { return stored_.rootVolumeIsReadOnly(); }

private:
    fixwell::OVPreferences& stored_;
    std::optional<bool> showsDetails_;
};

/// The host on a terminal: the shared services, and a toolkit without a screen.
class TerminalHost final : public SupportHost,
                           public fixwell::Events,
                           public fixwell::HelpManager,
                           public fixwell::Pasteboard,
                           public fixwell::Printing {
public:
    /// All references outlive this object.
    TerminalHost(SupportOptions options, MainLoop& loop, Interface& interface,
                 TerminalAlerts& alerts, Reporter& reporter, std::optional<bool> showsDetails);

    fixwell::OVPreferences& sharedPreferences() override { return preferences_; }
    fixwell::Alerts& alerts() override { return alerts_; }
    fixwell::Events& events() override { return *this; }
    fixwell::HelpManager& sharedHelpManager() override { return *this; }
    fixwell::InterfaceLoader& interfaceLoader() override { return interface_; }
    fixwell::Pasteboard& generalPasteboard() override { return *this; }
    fixwell::Printing& printing() override { return *this; }

    /// A terminal sends no modifier keys with a command.
    std::uint64_t currentModifierFlags() const override { return 0; }
    void openHelpAnchor(std::string_view anchor) override;
    /// No command copies or prints; the terminal and the shell do that. What is asked for all the
    /// same is answered with a sentence.
    void declareTypes(const std::vector<fixwell::PasteboardType>& types,
                      const void* owner) override;
    void setData(std::string_view data, fixwell::PasteboardType type) override;
    fixwell::PrintInfo& sharedPrintInfo() override { return printInfo_; }
    void runPrintOperation(fixwell::OutlineView& view, const fixwell::PrintInfo& info,
                           bool showsPanel, fixwell::Window* window) override;

private:
    RequestedPreferences preferences_;
    Interface& interface_;
    TerminalAlerts& alerts_;
    Reporter& reporter_;
    fixwell::PrintInfo printInfo_;
};

}  // namespace orvane
