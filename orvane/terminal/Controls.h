// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/toolkit/Control.h"

#include <string>

namespace orvane {

/// A button that nobody sees: a command presses it, and reads from it why it cannot.
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

/// The instructions beside the log; a terminal has its help instead.
class TerminalTextField final : public contract::TextField {
public:
    void setNeedsDisplay(bool /*needsDisplay*/) override {}
    void setEnabled(bool isEnabled) override { isEnabled_ = isEnabled; }
    bool isEnabled() const override { return isEnabled_; }
    void setToolTip(std::string_view /*text*/) override {}
    void setAttributedStringValue(const contract::StyledText& /*text*/) override {}

private:
    bool isEnabled_ = true;
};

class TerminalTextView final : public contract::TextView {
public:
    void setNeedsDisplay(bool /*needsDisplay*/) override {}
    void setString(std::string_view /*text*/) override {}
};

}  // namespace orvane
