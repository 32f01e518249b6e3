// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/StyledText.h"

#include <cstdint>
#include <string>
#include <string_view>

namespace contract {

/// The name of an action that a control sends, "verifyDisk:". A literal: it is not copied.
using Selector = std::string_view;

/// In points; y grows downwards.
struct Rect {
    double x = 0;
    double y = 0;
    double width = 0;
    double height = 0;

    friend bool operator==(const Rect&, const Rect&) = default;
};

/// Something on the screen. Main thread only; owned by the front end, and alive as long as the
/// module whose interface file names it.
class View {
public:
    virtual ~View() = default;

    virtual void setNeedsDisplay(bool needsDisplay) = 0;
};

class Control : public View {
public:
    virtual void setEnabled(bool isEnabled) = 0;
    virtual bool isEnabled() const = 0;
    virtual void setToolTip(std::string_view text) = 0;
};

/// Sends its action to the module when it is pressed.
class Button : public Control {
public:
    virtual void setTitle(std::string_view title) = 0;
    virtual void setAction(Selector action) = 0;
    /// 0 or 1 for a two-state button.
    virtual void setIntegerValue(std::int64_t value) = 0;
    /// "\r" is Return; empty for none.
    virtual void setKeyEquivalent(std::string_view key) = 0;
    virtual void setTag(std::int64_t tag) = 0;
};

class TextField : public Control {
public:
    virtual void setAttributedStringValue(const StyledText& text) = 0;
};

class TextView : public View {
public:
    virtual void setString(std::string_view text) = 0;
};

class Scroller {
public:
    virtual ~Scroller() = default;

    /// From 0.0 (top) to 1.0 (bottom).
    virtual double value() const = 0;
};

class Window {
public:
    virtual ~Window() = default;

    /// It has the user's attention.
    virtual bool isMainWindow() const = 0;
};

/// Asked by a split view where its divider may stand, in points from the first edge.
class SplitViewDelegate {
public:
    virtual double splitViewConstrainMinCoordinateOfSubviewAt(double proposed, int subview) = 0;
    virtual double splitViewConstrainMaxCoordinateOfSubviewAt(double proposed, int subview) = 0;

protected:
    ~SplitViewDelegate() = default;
};

}  // namespace contract
