// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/toolkit/Control.h"

#include <QLabel>
#include <QPlainTextEdit>

namespace orvane::desktop {

/// Text that is only read, with its fonts relative to the desktop's size. The label must live as
/// long as this object is used.
class QtTextField final : public contract::TextField {
public:
    explicit QtTextField(QLabel& label);

    void setNeedsDisplay(bool needsDisplay) override;
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

    void setNeedsDisplay(bool needsDisplay) override;
    void setString(std::string_view text) override;

private:
    QPlainTextEdit& widget_;
};

}  // namespace orvane::desktop
