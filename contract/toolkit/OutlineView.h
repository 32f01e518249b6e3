// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Dictionary.h"
#include "contract/toolkit/BrowserCell.h"
#include "contract/toolkit/Control.h"
#include "contract/toolkit/Event.h"
#include "contract/toolkit/Pasteboard.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace contract {

/// A row of the outline; no dictionary stands for the root.
using OutlineItem = Dictionary;

enum class DragOperation : std::uint32_t { None = 0, Copy = 1, Every = 0xFFFF'FFFF };

/// Answers what an outline view shows, and is asked before it changes. The column is never
/// needed: the log has one.
class OutlineViewDelegate {
public:
    virtual std::size_t outlineViewNumberOfChildrenOfItem(const OutlineItem& item) = 0;
    virtual OutlineItem outlineViewChildOfItem(std::size_t index, const OutlineItem& item) = 0;
    virtual bool outlineViewIsItemExpandable(const OutlineItem& item) = 0;
    virtual bool outlineViewShouldExpandItem(const OutlineItem& item) = 0;
    virtual bool outlineViewShouldSelectItem(const OutlineItem& item) = 0;
    virtual std::string outlineViewObjectValueForTableColumnByItem(const OutlineItem& item) = 0;
    virtual void outlineViewWillDisplayCellForTableColumnItem(BrowserCell& cell,
                                                              const OutlineItem& item) = 0;
    /// Empty for none.
    virtual std::string outlineViewToolTipForCell(const OutlineItem& item) = 0;
    virtual bool outlineViewWriteItemsToPasteboard(const std::vector<OutlineItem>& items,
                                                   Pasteboard& pasteboard) = 0;
    virtual DragOperation draggingSourceOperationMaskForLocal(bool isLocal) = 0;
    virtual DragOperation outlineViewValidateDrop(const OutlineItem& item,
                                                  std::ptrdiff_t index) = 0;
    virtual bool outlineViewAcceptDrop(const OutlineItem& item, std::ptrdiff_t index) = 0;
    /// Whether the view offers a context menu for the row.
    virtual bool outlineViewWillReturnMenu(std::ptrdiff_t row) = 0;
    /// Delete, sent by the view.
    virtual void deleteSelected(const void* sender) = 0;

protected:
    ~OutlineViewDelegate() = default;
};

/// The front end's side of an outline view: the widget itself.
class OutlineViewPeer {
public:
    virtual ~OutlineViewPeer() = default;

    virtual void reloadData() = 0;
    virtual std::size_t numberOfRows() const = 0;
    virtual std::vector<std::size_t> selectedRowIndexes() const = 0;
    virtual std::size_t numberOfSelectedRows() const = 0;
    virtual void scrollRowToVisible(std::size_t row) = 0;
    virtual Rect rectOfRow(std::size_t row) const = 0;
    virtual Rect frameOfCellAtColumnRow(std::size_t column, std::size_t row) const = 0;
    virtual Rect frameOfOutlineCellAtRow(std::size_t row) const = 0;
    virtual void keyDown(const KeyEvent& event) = 0;
    virtual void selectAll() = 0;
    virtual void setNeedsDisplay(bool needsDisplay) = 0;
    virtual void setNeedsDisplayInRect(const Rect& rect) = 0;
    virtual void setEnabled(bool isEnabled) = 0;
    virtual bool isEnabled() const = 0;
    virtual void setToolTip(std::string_view text) = 0;
    virtual void setIndentationPerLevel(double points) = 0;
    virtual void setDraggingSourceOperationMask(DragOperation mask, bool isLocal) = 0;
    /// The vertical scroller of the scroll view around the outline; none when there is none.
    virtual Scroller* verticalScroller() = 0;
};

/// A tree of rows. Concrete, so that a module can override what it must decide; the front end
/// sends every native event through the virtual operations and paints by the frames they give.
class OutlineView : public Control {
public:
    explicit OutlineView(OutlineViewPeer& peer) : peer_(peer) {}

    OutlineViewDelegate* dataSource() const { return dataSource_; }
    void setDataSource(OutlineViewDelegate* dataSource) { dataSource_ = dataSource; }
    void setDataCell(std::unique_ptr<BrowserCell> cell) { dataCell_ = std::move(cell); }
    BrowserCell* dataCell() const { return dataCell_.get(); }

    /// The item at a row of the list, or none.
    OutlineItem itemAtRow(std::size_t row) const;

    void reloadData() { peer_.reloadData(); }
    std::size_t numberOfRows() const { return peer_.numberOfRows(); }
    std::vector<std::size_t> selectedRowIndexes() const { return peer_.selectedRowIndexes(); }
    std::size_t numberOfSelectedRows() const { return peer_.numberOfSelectedRows(); }
    void scrollRowToVisible(std::size_t row) { peer_.scrollRowToVisible(row); }
    Rect rectOfRow(std::size_t row) const { return peer_.rectOfRow(row); }
    void setNeedsDisplayInRect(const Rect& rect) { peer_.setNeedsDisplayInRect(rect); }
    void setIndentationPerLevel(double points) { peer_.setIndentationPerLevel(points); }
    void setDraggingSourceOperationMask(DragOperation mask, bool isLocal)
    {
        peer_.setDraggingSourceOperationMask(mask, isLocal);
    }
    Scroller* verticalScroller() { return peer_.verticalScroller(); }

    void setNeedsDisplay(bool needsDisplay) override { peer_.setNeedsDisplay(needsDisplay); }
    void setEnabled(bool isEnabled) override { peer_.setEnabled(isEnabled); }
    bool isEnabled() const override { return peer_.isEnabled(); }
    void setToolTip(std::string_view text) override { peer_.setToolTip(text); }

    virtual void keyDown(const KeyEvent& event) { peer_.keyDown(event); }
    virtual bool validateMenuItem(const MenuItem&) { return true; }
    virtual void copy(const void* /*sender*/) {}
    virtual void delete_(const void* /*sender*/) {}
    virtual void selectAll(const void* /*sender*/) { peer_.selectAll(); }
    virtual Rect frameOfOutlineCellAtRow(std::size_t row) const
    {
        return peer_.frameOfOutlineCellAtRow(row);
    }
    virtual Rect frameOfCellAtColumnRow(std::size_t column, std::size_t row) const
    {
        return peer_.frameOfCellAtColumnRow(column, row);
    }

private:
    OutlineViewPeer& peer_;  ///< outlives the view
    OutlineViewDelegate* dataSource_ = nullptr;
    std::unique_ptr<BrowserCell> dataCell_;
};

inline OutlineItem OutlineView::itemAtRow(std::size_t row) const
{
    return dataSource_ != nullptr ? dataSource_->outlineViewChildOfItem(row, {}) : OutlineItem();
}

}  // namespace contract
