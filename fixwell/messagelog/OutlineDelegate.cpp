// SPDX-License-Identifier: Apache-2.0
#include "fixwell/messagelog/MessageRecord.h"
#include "fixwell/messagelog/OVFXWMessageOutlineView.h"
#include "fixwell/module/OVFXW.h"

namespace fixwell {

std::size_t OVFXW::outlineViewNumberOfChildrenOfItem(const OutlineItem& item)
{
    if (item)
        return 0;
    rows_.update(historiesOfSelection(), showDetails);
    return rows_.count();
}

OutlineItem OVFXW::outlineViewChildOfItem(std::size_t index, const OutlineItem& item)
{
    return item ? OutlineItem() : currentRows().at(index);
}

const MessageRows& OVFXW::currentRows()
{
    if (!rows_.isValid())
        rows_.update(historiesOfSelection(), showDetails);
    return rows_;
}

bool OVFXW::outlineViewIsItemExpandable(const OutlineItem& /*item*/)
{
    return true;
}

bool OVFXW::outlineViewShouldExpandItem(const OutlineItem& /*item*/)
{
    return showDetails;
}

bool OVFXW::outlineViewShouldSelectItem(const OutlineItem& /*item*/)
{
    return true;
}

std::string OVFXW::outlineViewObjectValueForTableColumnByItem(const OutlineItem& /*item*/)
{
    return {};
}

void OVFXW::outlineViewWillDisplayCellForTableColumnItem(BrowserCell& cell, const OutlineItem& item)
{
    const StyledText text = finalText(item);
    cell.setAttributedStringValue(text ? text : StyledText::make(" "));
    cell.setLeaf(true);
    cell.removeImage();
}

std::string OVFXW::outlineViewToolTipForCell(const OutlineItem& /*item*/)
{
    return {};
}

bool OVFXW::outlineViewWriteItemsToPasteboard(const std::vector<OutlineItem>& items,
                                              Pasteboard& pasteboard)
{
    const StyledText text = StyledText::make();
    for (const OutlineItem& item : items)
        text.append(finalText(item));
    if (text.isEmpty())
        return false;
    writeToPasteboard(pasteboard, text, static_cast<OutlineViewDelegate*>(this));
    return true;
}

DragOperation OVFXW::draggingSourceOperationMaskForLocal(bool /*isLocal*/)
{
    return DragOperation::Copy;
}

DragOperation OVFXW::outlineViewValidateDrop(const OutlineItem& /*item*/, std::ptrdiff_t /*index*/)
{
    return DragOperation::None;
}

bool OVFXW::outlineViewAcceptDrop(const OutlineItem& /*item*/, std::ptrdiff_t /*index*/)
{
    return false;
}

bool OVFXW::outlineViewWillReturnMenu(std::ptrdiff_t /*row*/)
{
    return false;
}

void OVFXW::showDetailsAction(const void* /*sender*/)
{
    showDetails = !showDetails;
    host().sharedPreferences().setShowDetailsInFixwell(showDetails);
    reloadMessageView();
}

void OVFXW::deleteSelected(const void* sender)
{
    if (messageOutlineView != nullptr &&
        messageOutlineView->numberOfSelectedRows() == messageOutlineView->numberOfRows())
        clearHistoryAction(sender);
}

bool OVFXW::canPrint()
{
    return !allFsckHistoryOfSelection().isEmpty();
}

void OVFXW::printModuleSpecific(const void* /*sender*/)
{
    if (messageOutlineView == nullptr)
        return;
    PrintInfo& info = host().printing().sharedPrintInfo();
    info.horizontalPagination = Pagination::Fit;
    info.isHorizontallyCentered = false;
    info.isVerticallyCentered = false;
    host().printing().runPrintOperation(*messageOutlineView, info, true, &utilityViewWindow());
}

}  // namespace fixwell
