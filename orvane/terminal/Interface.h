// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/toolkit/Interface.h"
#include "orvane/terminal/Controls.h"
#include "orvane/terminal/LogView.h"

#include <map>
#include <memory>
#include <string>
#include <string_view>

namespace orvane {

/// A module's interface on a terminal: for each outlet a control that nobody sees, and the log's
/// rows on standard output. The controls are pressed by commands.
class Interface final : public contract::InterfaceLoader {
public:
    explicit Interface(LogView& logView) : logView_(logView) {}

    bool loadInterface(std::string_view name, contract::InterfaceOwner& owner) override;
    void disconnect(contract::InterfaceOwner& owner) override;

    /// None when the module has no such outlet.
    TerminalButton* button(std::string_view outlet);
    /// Sends the button's action to the module, as a click would; NO when the button is disabled.
    bool press(TerminalButton& button);

private:
    void connect(const contract::Outlet& outlet, contract::InterfaceOwner& owner);

    LogView& logView_;
    contract::InterfaceOwner* owner_ = nullptr;
    std::map<std::string, TerminalButton, std::less<>> buttons_;
    TerminalTextField textField_;
    TerminalTextView textView_;
    std::unique_ptr<contract::OutlineView> outlineView_;
};

}  // namespace orvane
