// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/toolkit/Control.h"

#include <QAbstractButton>

#include <functional>
#include <string>

namespace orvane::desktop {

/// A push button or a check box. The widget must live as long as this object is used.
class QtButton final : public contract::Button {
public:
    using Pressed = std::function<void(QtButton& sender)>;

    /// `pressed` is called with every click of the user and every `press`.
    QtButton(QAbstractButton& widget, Pressed pressed);
    QtButton(const QtButton&) = delete;
    QtButton& operator=(const QtButton&) = delete;
    ~QtButton() override;

    void setNeedsDisplay(bool needsDisplay) override;
    /// A button that works has no reason not to.
    void setEnabled(bool isEnabled) override;
    bool isEnabled() const override { return widget_.isEnabled(); }
    void setToolTip(std::string_view text) override;
    void setTitle(std::string_view title) override;
    void setAction(contract::Selector action) override { action_ = action; }
    void setIntegerValue(std::int64_t value) override { widget_.setChecked(value != 0); }
    void setKeyEquivalent(std::string_view key) override;
    void setTag(std::int64_t tag) override { tag_ = tag; }
    void setReason(std::string_view reason) override;

    contract::Selector action() const { return action_; }
    /// As the module gave it, without the escapes that the widget needs.
    const std::string& title() const { return title_; }
    const std::string& reason() const { return reason_; }
    /// What the host has to say about why the button is grey, behind the module's reason; until
    /// the module says something else, or the button can be pressed again.
    void setHostReason(std::string_view reason);
    std::int64_t tag() const { return tag_; }
    bool isChecked() const { return widget_.isChecked(); }
    /// Return presses it.
    bool isDefault() const { return isDefault_; }
    QAbstractButton& widget() const { return widget_; }

    /// As a click does; nothing when the button is disabled.
    void press() { widget_.click(); }

private:
    void setModuleText(std::string& text, std::string_view value);
    void showToolTip();

    QAbstractButton& widget_;
    QMetaObject::Connection clicks_;
    std::string action_;
    std::string title_;
    std::string toolTip_;
    std::string reason_;
    std::string hostReason_;
    std::int64_t tag_ = 0;
    bool isDefault_ = false;
};

}  // namespace orvane::desktop
