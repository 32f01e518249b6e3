// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/SupportHost.h"
#include "orvane/support/loop/MainLoop.h"
#include "orvane/terminal/Interface.h"
#include "orvane/terminal/TerminalAlerts.h"

#include <optional>

namespace orvane {

/// Preferences as stored, but for what the command line says for this once.
class RequestedPreferences final : public contract::OVPreferences {
public:
    RequestedPreferences(contract::OVPreferences& stored, std::optional<bool> showsDetails)
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
    contract::OVPreferences& stored_;
    std::optional<bool> showsDetails_;
};

/// The host on a terminal: the shared services, and a toolkit without a screen.
class TerminalHost final : public SupportHost,
                           public contract::Events,
                           public contract::HelpManager,
                           public contract::Pasteboard,
                           public contract::Printing {
public:
    /// All references outlive this object.
    TerminalHost(SupportOptions options, MainLoop& loop, Interface& interface,
                 TerminalAlerts& alerts, Reporter& reporter, std::optional<bool> showsDetails);

    contract::OVPreferences& sharedPreferences() override { return preferences_; }
    contract::Alerts& alerts() override { return alerts_; }
    contract::Events& events() override { return *this; }
    contract::HelpManager& sharedHelpManager() override { return *this; }
    contract::InterfaceLoader& interfaceLoader() override { return interface_; }
    contract::Pasteboard& generalPasteboard() override { return *this; }
    contract::Printing& printing() override { return *this; }

    /// A terminal sends no modifier keys with a command.
    std::uint64_t currentModifierFlags() const override { return 0; }
    void openHelpAnchor(std::string_view anchor) override;
    /// No command copies or prints; the terminal and the shell do that. What is asked for all the
    /// same is answered with a sentence.
    void declareTypes(const std::vector<contract::PasteboardType>& types,
                      const void* owner) override;
    void setData(std::string_view data, contract::PasteboardType type) override;
    contract::PrintInfo& sharedPrintInfo() override { return printInfo_; }
    void runPrintOperation(contract::OutlineView& view, const contract::PrintInfo& info,
                           bool showsPanel, contract::Window* window) override;

private:
    RequestedPreferences preferences_;
    Interface& interface_;
    TerminalAlerts& alerts_;
    Reporter& reporter_;
    contract::PrintInfo printInfo_;
};

}  // namespace orvane
