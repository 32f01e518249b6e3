// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/LogView.h"

namespace orvane {

void LogView::countRows()
{
    const bool hasSource = view_ != nullptr && view_->dataSource() != nullptr;
    rows_ = hasSource ? view_->dataSource()->outlineViewNumberOfChildrenOfItem({}) : 0;
}

void LogView::followFromLastRow()
{
    countRows();
    writeFrom(rows_ > 0 ? rows_ - 1 : 0);
}

void LogView::writeAllRows()
{
    countRows();
    writeFrom(0);
}

void LogView::writeFrom(std::size_t row)
{
    written_ = row;
    isWriting_ = true;
    writeNewRows();
}

void LogView::reloadData()
{
    countRows();
    if (!isWriting_ || isWaiting_)
        return;
    isWaiting_ = true;
    loop_.performOnMainThread([this] { flush(); }, contract::RunLoop::Wait::No);
}

void LogView::holdBack()
{
    flush();
    isWriting_ = false;
}

void LogView::flush()
{
    isWaiting_ = false;
    if (!isWriting_)
        return;
    countRows();
    writeNewRows();
}

void LogView::writeNewRows()
{
    if (written_ >= rows_ || view_ == nullptr)
        return;
    beforeRows_();
    contract::BrowserCell* const cell = view_->dataCell();
    for (; written_ < rows_; ++written_) {
        const contract::OutlineItem item = view_->itemAtRow(written_);
        if (cell == nullptr || !item)
            continue;
        view_->dataSource()->outlineViewWillDisplayCellForTableColumnItem(*cell, item);
        writeRow_(item, cell->attributedStringValue());
    }
    afterRows_();
}

}  // namespace orvane
