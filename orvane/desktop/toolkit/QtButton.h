// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/host/toolkit/Control.h"

#include <QAbstractButton>

#include <functional>
#include <string>

namespace orvane::desktop {

/// A push button or a check box. The widget must live as long as this object is used.
class QtButton final : public fixwell::Button {
public:
    using Pressed = std::function<void(QtButton& sender)>;

    /// `pressed` is called with every click of the user and every `press`.
    QtButton(QAbstractButton& widget, Pressed pressed);
    QtButton(const QtButton&) = delete;
    QtButton& operator=(const QtButton&) = delete;
    ~QtButton() override;

    void setNeedsDisplay(bool needsDisplay) override;
    void setEnabled(bool isEnabled) override { widget_.setEnabled(isEnabled); }
    bool isEnabled() const override { return widget_.isEnabled(); }
    void setToolTip(std::string_view text) override;
    void setTitle(std::string_view title) override;
    void setAction(fixwell::Selector action) override { action_ = action; }
    void setIntegerValue(std::int64_t value) override { widget_.setChecked(value != 0); }
    void setKeyEquivalent(std::string_view key) override;
    void setTag(std::int64_t tag) override { tag_ = tag; }

    fixwell::Selector action() const { return action_; }
    /// As the module gave it, without the escapes that the widget needs.
    const std::string& title() const { return title_; }
    const std::string& toolTip() const { return toolTip_; }
    std::int64_t tag() const { return tag_; }
    bool isChecked() const { return widget_.isChecked(); }
    /// Return presses it.
    bool isDefault() const { return isDefault_; }
    QAbstractButton& widget() { return widget_; }

    /// As a click does; nothing when the button is disabled.
    void press() { widget_.click(); }

private:
    QAbstractButton& widget_;
    QMetaObject::Connection clicks_;
    std::string action_;
    std::string title_;
    std::string toolTip_;
    std::int64_t tag_ = 0;
    bool isDefault_ = false;
};

}  // namespace orvane::desktop
