// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/TerminalToolkit.h"

#include "contract/toolkit/ControlNames.h"

#include <algorithm>

namespace orvane {
namespace {

/// The actions that the interface file gives to buttons; the module sets the others itself.
contract::Selector actionInFile(std::string_view outlet)
{
    if (outlet == contract::outlet::showDetails)
        return contract::selector::showDetails;
    return outlet == contract::outlet::clearHistory ? contract::selector::clearHistory : "";
}

}  // namespace

bool TerminalInterface::loadInterface(std::string_view /*name*/, contract::InterfaceOwner& owner)
{
    owner_ = &owner;
    for (const contract::Outlet& outlet : owner.outlets())
        connect(outlet, owner);
    owner.awakeFromNib();
    return true;
}

void TerminalInterface::connect(const contract::Outlet& outlet, contract::InterfaceOwner& owner)
{
    names_.emplace_back(outlet.name);
    if (auto* const button = std::get_if<contract::Button**>(&outlet.place)) {
        TerminalButton& made = buttons_[std::string(outlet.name)];
        made.setAction(actionInFile(outlet.name));
        **button = &made;
    } else if (auto* const field = std::get_if<contract::TextField**>(&outlet.place)) {
        **field = &textFields_[names_.back()];
    } else if (auto* const view = std::get_if<contract::TextView**>(&outlet.place)) {
        **view = &textViews_[names_.back()];
    } else {
        outlineView_ = owner.makeOutlineView(contract::messageOutlineViewClass, logView_);
        if (!outlineView_)
            return;
        outlineView_->setDataSource(owner.outlineViewDelegate());
        logView_.setView(outlineView_.get());
        *std::get<contract::OutlineView**>(outlet.place) = outlineView_.get();
    }
}

void TerminalInterface::disconnect(contract::InterfaceOwner& owner)
{
    if (owner_ == &owner)
        owner_ = nullptr;
}

TerminalButton& TerminalInterface::button(std::string_view outlet)
{
    const auto found = buttons_.find(outlet);
    return found == buttons_.end() ? missingButton_ : found->second;
}

TerminalButton* TerminalInterface::stopButton()
{
    const auto found = std::ranges::find_if(buttons_, [](const auto& named) {
        return named.second.action() == contract::selector::stop && named.second.isEnabled();
    });
    return found == buttons_.end() ? nullptr : &found->second;
}

std::vector<std::pair<std::string, std::string>> TerminalInterface::texts() const
{
    std::vector<std::pair<std::string, std::string>> texts;
    for (const std::string& name : names_) {
        const auto field = textFields_.find(name);
        const auto view = textViews_.find(name);
        if (field != textFields_.end())
            texts.emplace_back(name, field->second.text());
        else if (view != textViews_.end())
            texts.emplace_back(name, view->second.text());
    }
    return texts;
}

std::vector<std::pair<std::string, const TerminalButton*>> TerminalInterface::buttons() const
{
    std::vector<std::pair<std::string, const TerminalButton*>> buttons;
    for (const std::string& name : names_)
        if (const auto found = buttons_.find(name); found != buttons_.end())
            buttons.emplace_back(name, &found->second);
    return buttons;
}

bool TerminalInterface::press(TerminalButton& button)
{
    return button.isEnabled() && owner_ != nullptr && owner_->perform(button.action(), &button);
}

}  // namespace orvane
