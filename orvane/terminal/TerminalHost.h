// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/RunLoop.h"
#include "contract/toolkit/Alert.h"
#include "orvane/support/SupportHost.h"
#include "orvane/support/loop/MainLoop.h"
#include "orvane/terminal/Reporter.h"
#include "orvane/terminal/TerminalToolkit.h"

#include <optional>

namespace orvane {

/// Alerts as text. A question is answered by --yes, or asked on the terminal, where only the word
/// for yes, or its first letter, confirms, in English or in the user's language; without a terminal
/// it is answered with the button that Return stands for.
class TerminalAlerts final : public contract::Alerts {
public:
    enum class Answer { Confirm, Ask, Decline };

    /// All outlive this object; the texts are asked when a question is.
    TerminalAlerts(contract::RunLoop& loop, Reporter& reporter, const Catalogue& texts,
                   Answer answer)
        : loop_(loop), reporter_(reporter), texts_(texts), answer_(answer)
    {
    }

    std::shared_ptr<contract::Alert> makeAlert(const contract::Alert::Text& text) override;
    void simpleModuleAlert(const std::string& title, const std::string& message,
                           std::int32_t error) override;

    /// A question waits for its answer.
    bool isAsking() const { return isAsking_; }
    /// The last question was not confirmed.
    bool wasDeclined() const { return wasDeclined_; }

private:
    class Question;

    contract::RunLoop& loop_;
    Reporter& reporter_;
    const Catalogue& texts_;
    Answer answer_;
    bool isAsking_ = false;
    bool wasDeclined_ = false;
};

/// The stored preferences, except for what the command line sets for this run.
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
    TerminalHost(SupportOptions options, MainLoop& loop, TerminalInterface& interface,
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
    TerminalInterface& interface_;
    TerminalAlerts& alerts_;
    Reporter& reporter_;
    contract::PrintInfo printInfo_;
};

}  // namespace orvane
