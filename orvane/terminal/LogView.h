// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/RunLoop.h"
#include "contract/toolkit/OutlineView.h"

#include <functional>

namespace orvane {

/// The outline view of the log on a terminal. A terminal cannot be drawn anew, so rows are
/// written once, in their order. As a window does, the view only notes that it has to reload, and
/// draws when the main loop comes to it: a burst of lines is then saved and written together.
class LogView final : public contract::OutlineViewPeer {
public:
    /// A row with its text as the module's cell holds it.
    using RowWriter =
        std::function<void(const contract::Dictionary& record, const contract::StyledText& text)>;

    /// `beforeRows` is called before rows are written: what is shown must be on the disk first.
    /// `afterRows` is called when no more are waiting.
    /// The loop outlives this object, and runs nothing more once it is gone.
    LogView(contract::RunLoop& loop, RowWriter writeRow, std::function<void()> beforeRows,
            std::function<void()> afterRows)
        : loop_(loop),
          writeRow_(std::move(writeRow)),
          beforeRows_(std::move(beforeRows)),
          afterRows_(std::move(afterRows))
    {
    }

    /// The view whose data source and cell are asked; it must live as long as this object.
    void setView(contract::OutlineView* view) { view_ = view; }

    /// Writes what is waiting, and then nothing until the next call of one of the two below.
    void holdBack();
    /// Goes on with the newest row there is now, and writes every row that follows.
    void followFromLastRow();
    /// Writes all rows there are.
    void writeAllRows();
    /// Writes what is waiting.
    void flush();

    void reloadData() override;
    std::size_t numberOfRows() const override { return rows_; }
    std::vector<std::size_t> selectedRowIndexes() const override { return {}; }
    std::size_t numberOfSelectedRows() const override { return 0; }
    void scrollRowToVisible(std::size_t /*row*/) override {}
    contract::Rect rectOfRow(std::size_t /*row*/) const override { return {}; }
    contract::Rect frameOfCellAtColumnRow(std::size_t, std::size_t) const override { return {}; }
    contract::Rect frameOfOutlineCellAtRow(std::size_t /*row*/) const override { return {}; }
    void keyDown(const contract::KeyEvent& /*event*/) override {}
    void selectAll() override {}
    void setNeedsDisplay(bool /*needsDisplay*/) override {}
    void setNeedsDisplayInRect(const contract::Rect& /*rect*/) override {}
    void setEnabled(bool isEnabled) override { isEnabled_ = isEnabled; }
    bool isEnabled() const override { return isEnabled_; }
    void setToolTip(std::string_view /*text*/) override {}
    void setIndentationPerLevel(double /*points*/) override {}
    void setDraggingSourceOperationMask(contract::DragOperation, bool) override {}
    contract::Scroller* verticalScroller() override { return nullptr; }

private:
    void countRows();
    void writeFrom(std::size_t row);
    void writeNewRows();

    contract::RunLoop& loop_;
    RowWriter writeRow_;
    std::function<void()> beforeRows_;
    std::function<void()> afterRows_;
    contract::OutlineView* view_ = nullptr;
    std::size_t rows_ = 0;
    std::size_t written_ = 0;
    bool isWriting_ = false;
    bool isWaiting_ = false;  ///< the loop will come to `flush`
    bool isEnabled_ = true;
};

}  // namespace orvane
