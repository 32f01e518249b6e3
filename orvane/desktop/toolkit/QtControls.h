// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/toolkit/Control.h"
#include "contract/toolkit/Event.h"

#include <QAbstractButton>
#include <QLabel>
#include <QPlainTextEdit>
#include <QScrollBar>
#include <Qt>

#include <functional>
#include <string>

namespace orvane::desktop {

std::uint64_t modifierFlags(Qt::KeyboardModifiers modifiers);
/// The module's code for a key; `otherKey` for those that modules do not tell apart.
std::uint16_t keyCodeOf(int qtKey);
inline constexpr std::uint16_t otherKey = 0xFFFF;

/// The keys that are held down now.
class QtEvents final : public contract::Events {
public:
    std::uint64_t currentModifierFlags() const override;
};

/// A scroll bar, which must live as long as this object is used.
class QtScroller final : public contract::Scroller {
public:
    explicit QtScroller(const QScrollBar& bar) : bar_(bar) {}

    /// 1.0 also when everything fits: the end is in sight.
    double value() const override
    {
        const int range = bar_.maximum() - bar_.minimum();
        return range > 0 ? static_cast<double>(bar_.value() - bar_.minimum()) / range : 1.0;
    }

private:
    const QScrollBar& bar_;
};

/// What a view does with `setNeedsDisplay`.
inline void redraw(QWidget& widget, bool isNeeded)
{
    if (isNeeded)
        widget.update();
}

/// Text that is only read, with its fonts relative to the desktop's size. The label must live as
/// long as this object is used.
class QtTextField final : public contract::TextField {
public:
    explicit QtTextField(QLabel& label);

    void setNeedsDisplay(bool needsDisplay) override { redraw(label_, needsDisplay); }
    void setEnabled(bool isEnabled) override { label_.setEnabled(isEnabled); }
    bool isEnabled() const override { return label_.isEnabled(); }
    void setToolTip(std::string_view text) override;
    void setAttributedStringValue(const contract::StyledText& text) override;

private:
    QLabel& label_;
};

/// A place for plain messages that takes no room while there is none. The widget must live as
/// long as this object is used.
class QtTextView final : public contract::TextView {
public:
    explicit QtTextView(QPlainTextEdit& widget);

    void setNeedsDisplay(bool needsDisplay) override { redraw(*widget_.viewport(), needsDisplay); }
    void setString(std::string_view text) override;

private:
    QPlainTextEdit& widget_;
};

/// A push button or a check box. The widget must live as long as this object is used.
class QtButton final : public contract::Button {
public:
    using Pressed = std::function<void(QtButton& sender)>;

    /// `pressed` is called with every click of the user and every `press`.
    QtButton(QAbstractButton& widget, Pressed pressed);
    QtButton(const QtButton&) = delete;
    QtButton& operator=(const QtButton&) = delete;
    ~QtButton() override;

    void setNeedsDisplay(bool needsDisplay) override { redraw(widget_, needsDisplay); }
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
