// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/Contract.h"

#include <functional>
#include <string>
#include <vector>

namespace fixwell::testing {

/// What every control can be told.
template <class Kind>
struct FakeControl : Kind {
    bool enabled = true;
    std::string toolTip;

    void setNeedsDisplay(bool) override {}
    void setEnabled(bool isOn) override { enabled = isOn; }
    bool isEnabled() const override { return enabled; }
    void setToolTip(std::string_view text) override { toolTip = text; }
};

struct FakeButton final : FakeControl<Button> {
    std::string reason;
    std::string title;
    std::string action;
    std::string key = "unset";
    std::int64_t value = -1;
    std::int64_t tag = 0;

    void setTitle(std::string_view text) override { title = text; }
    void setAction(Selector selector) override { action = selector; }
    void setIntegerValue(std::int64_t number) override { value = number; }
    void setKeyEquivalent(std::string_view equivalent) override { key = equivalent; }
    void setTag(std::int64_t number) override { tag = number; }
    void setReason(std::string_view text) override { reason = text; }
};

struct FakeTextField final : FakeControl<TextField> {
    std::string text;

    void setAttributedStringValue(const StyledText& value) override { text = value.characters(); }
};

struct FakeTextView final : TextView {
    std::string text;

    void setNeedsDisplay(bool) override {}
    void setString(std::string_view value) override { text = value; }
};

struct FakeScroller final : Scroller {
    double position = 1.0;

    double value() const override { return position; }
};

/// A widget without a screen: it counts its rows when it is told to reload, as a real one does.
struct FakeOutlinePeer final : FakeControl<OutlineViewPeer> {
    OutlineViewDelegate* delegate = nullptr;
    std::size_t rows = 0;
    int reloads = 0;
    int baseKeys = 0;
    std::vector<std::size_t> selected;
    std::vector<std::size_t> scrolledTo;
    std::vector<Rect> redrawn;
    FakeScroller scroller;

    void reloadData() override
    {
        ++reloads;
        rows = delegate != nullptr ? delegate->outlineViewNumberOfChildrenOfItem({}) : 0;
    }
    std::size_t numberOfRows() const override { return rows; }
    std::vector<std::size_t> selectedRowIndexes() const override { return selected; }
    std::size_t numberOfSelectedRows() const override { return selected.size(); }
    void scrollRowToVisible(std::size_t row) override { scrolledTo.push_back(row); }
    Rect rectOfRow(std::size_t row) const override
    {
        return row < rows ? Rect{0, 17.0 * static_cast<double>(row), 400, 17} : Rect{};
    }
    Rect frameOfCellAtColumnRow(std::size_t, std::size_t row) const override
    {
        return {35, 17.0 * static_cast<double>(row), 300, 17};
    }
    Rect frameOfOutlineCellAtRow(std::size_t) const override { return {0, 0, 10, 10}; }
    void keyDown(const KeyEvent&) override { ++baseKeys; }
    void selectAll() override {}
    void setNeedsDisplayInRect(const Rect& rect) override { redrawn.push_back(rect); }
    void setIndentationPerLevel(double) override {}
    void setDraggingSourceOperationMask(DragOperation, bool) override {}
    Scroller* verticalScroller() override { return &scroller; }
};

struct FakeAlert final : Alert {
    Text text;
    FakeButton defaultButton;
    FakeButton alternateButton;
    std::function<void(Alert&, long)> end;
    bool isOrderedOut = false;

    std::vector<Button*> buttons() override { return {&defaultButton, &alternateButton}; }
    void beginSheetModalForWindow(Window*, std::function<void(Alert&, long)> then) override
    {
        end = std::move(then);
    }
    void orderOut() override { isOrderedOut = true; }
};

}  // namespace fixwell::testing
