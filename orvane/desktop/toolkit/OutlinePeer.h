// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/toolkit/OutlineView.h"
#include "orvane/desktop/toolkit/LogModel.h"
#include "orvane/desktop/toolkit/LogTable.h"
#include "orvane/desktop/toolkit/QtControls.h"

#include <QPointer>
#include <QTimer>

#include <functional>
#include <optional>
#include <utility>
#include <vector>

namespace orvane::desktop {

/// Where the reader of a log is: which rows are in sight, and which are selected. Rows are known
/// by their records, so that the place is found again when rows were added between them, or when
/// details came or went. Main thread.
class LogPlace {
public:
    /// Nowhere: at the end of an empty log.
    LogPlace() = default;
    /// Taken while the view still answers the rows that the table shows. Costs as much as the
    /// rows in sight and the selected stretches.
    LogPlace(const LogTable& table, const LogModel& model);

    /// The last row was in sight, so that the next ones are expected there, too.
    bool isAtEnd() const { return isAtEnd_; }
    /// Selects again what was selected, as far as it is there.
    void restoreSelection(LogTable& table, const LogModel& model) const;
    /// Brings a row back to where it was in the table; NO when none of the rows is there any more.
    bool restoreSight(LogTable& table, const LogModel& model) const;

private:
    struct Row {
        int number;
        contract::OutlineItem item;
    };
    struct SightedRow {
        Row row;
        int top;  ///< pixels, from the top of the viewport
    };
    struct Stretch {
        Row first;
        Row last;
    };

    void noteSight(const LogTable& table, const LogModel& model);
    std::optional<int> find(const LogModel& model, const Row& row) const;

    bool isAtEnd_ = true;
    int rows_ = 0;
    std::vector<SightedRow> inSight_;
    std::vector<Stretch> selected_;
    std::optional<Row> current_;
};

/// An outline view on the screen. A reload is noted, and done when the event loop comes to it: a
/// burst of lines is then saved and shown together. The number of rows is right at once.
class OutlinePeer final : public contract::OutlineViewPeer {
public:
    /// `table` must live as long as this object. `beforeRows` is called before new rows are
    /// shown: what is shown must be on the disk first.
    OutlinePeer(LogTable& table, std::function<void()> beforeRows);
    OutlinePeer(const OutlinePeer&) = delete;
    OutlinePeer& operator=(const OutlinePeer&) = delete;
    ~OutlinePeer() override;

    /// The module's view; it must live until it is taken away with none.
    void setView(contract::OutlineView* view);
    /// Shows what is waiting.
    void flush();
    LogTable& table() { return *table_; }
    const LogModel& model() const { return model_; }
    /// The selected rows as HTML and as plain text, for the pasteboard. Headings come with what is
    /// known of their runs.
    std::string selectionHTML() const;
    std::string selectionText() const;

    void setRunKnowledge(RunKnowledge knowledge) { model_.setRunKnowledge(std::move(knowledge)); }
    void setFilter(LogRuns::Filter filter);
    /// Unfolds what hides a row of the view, and makes it the one that is selected and in sight; NO
    /// where it is not shown even then.
    bool goTo(std::size_t row);
    /// Told after the rows of the view have changed.
    void setRowsChanged(std::function<void(LogModel::Change)> told)
    {
        rowsChanged_ = std::move(told);
    }
    /// Escape was pressed in the log.
    void setEscaped(std::function<void()> told) { escaped_ = std::move(told); }

    void reloadData() override;
    std::size_t numberOfRows() const override { return rows_; }
    std::vector<std::size_t> selectedRowIndexes() const override;
    std::size_t numberOfSelectedRows() const override;
    void scrollRowToVisible(std::size_t row) override;
    /// In the coordinates of the table's viewport; zero for a row that is not there.
    contract::Rect rectOfRow(std::size_t row) const override;
    contract::Rect frameOfCellAtColumnRow(std::size_t column, std::size_t row) const override;
    contract::Rect frameOfOutlineCellAtRow(std::size_t row) const override;
    void keyDown(const contract::KeyEvent& event) override;
    void selectAll() override;
    void setNeedsDisplay(bool needsDisplay) override { redraw(*table_->viewport(), needsDisplay); }
    void setNeedsDisplayInRect(const contract::Rect& rect) override;
    void setEnabled(bool isEnabled) override { table_->setEnabled(isEnabled); }
    bool isEnabled() const override { return table_->isEnabled(); }
    void setToolTip(std::string_view text) override;
    /// The log has no levels to indent.
    void setIndentationPerLevel(double /*points*/) override {}
    void setDraggingSourceOperationMask(contract::DragOperation mask, bool isLocal) override;
    contract::Scroller* verticalScroller() override { return &scroller_; }

private:
    void noteChange();
    void reload();
    void lookOn();
    void keepPlace(const LogPlace& place);
    void selectShownRows();
    void toggle(int shown);
    bool takeFoldingKey(const QKeyEvent& event);
    void sendKey(QKeyEvent& event);
    void drag();

    QPointer<LogTable> table_;
    std::function<void()> beforeRows_;
    LogModel model_;
    QtScroller scroller_;
    contract::OutlineView* view_ = nullptr;
    std::size_t rows_ = 0;
    /// The first so many rows of the view are selected, also those that are folded; 0 when the
    /// selection is the table's.
    std::size_t selectedWhole_ = 0;
    bool isOwnChange_ = false;  ///< of the selection, because rows come and go
    QTimer look_;
    std::function<void(LogModel::Change)> rowsChanged_;
    std::function<void()> escaped_;
    bool mustReload_ = false;
    bool isWaiting_ = false;  ///< the event loop will come to `flush`
    LogPlace place_;          ///< of the reader, before the reload that is waiting
    std::optional<std::size_t> mustShow_;
    bool mustShowEnd_ = false;  ///< the row to be shown was the last one
    contract::DragOperation localMask_ = contract::DragOperation::None;
    contract::DragOperation outsideMask_ = contract::DragOperation::None;
};

}  // namespace orvane::desktop
