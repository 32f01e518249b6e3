// SPDX-License-Identifier: Apache-2.0
#include "fixwell/messagelog/OVFXWMessageOutlineView.h"

#include "contract/foundation/StyledText.h"
#include "fixwell/messagelog/MessageRecord.h"

namespace fixwell {
namespace {

constexpr double shiftToTheLeft = 13;  // points
constexpr double addedWidth = 15;

bool isDeletingKey(std::uint16_t keyCode)
{
    return keyCode == keyDelete || keyCode == keyForwardDelete || keyCode == keyKeypadClear;
}

}  // namespace

void writeToPasteboard(Pasteboard& pasteboard, const StyledText& text, const void* owner)
{
    using enum PasteboardType;
    pasteboard.declareTypes({PlainString, TabularText, RTF, RTFD}, owner);
    pasteboard.setData(text.characters(), PlainString);
    pasteboard.setData(text.characters(), TabularText);
    pasteboard.setData(rtf(text), RTF);
    pasteboard.setData(rtfd(text), RTFD);
}

void OVFXWMessageOutlineView::delete_(const void* sender)
{
    if (dataSource() != nullptr)
        dataSource()->deleteSelected(sender);
}

void OVFXWMessageOutlineView::copy(const void* /*sender*/)
{
    setPasteboard(generalPasteboard_);
}

void OVFXWMessageOutlineView::setPasteboard(Pasteboard& pasteboard)
{
    const StyledText text = StyledText::make();
    for (const std::size_t row : selectedRowIndexes())
        text.append(finalText(itemAtRow(row)));
    writeToPasteboard(pasteboard, text, this);
}

bool OVFXWMessageOutlineView::hasAllRowsSelected() const
{
    return numberOfRows() > 0 && numberOfSelectedRows() == numberOfRows();
}

bool OVFXWMessageOutlineView::validateMenuItem(const MenuItem& item)
{
    if (item.action == "copy:")
        return numberOfSelectedRows() > 0;
    if (item.action == "delete:")
        return hasAllRowsSelected();
    return item.action == "selectAll:" && numberOfRows() > 0;
}

void OVFXWMessageOutlineView::keyDown(const KeyEvent& event)
{
    if (!isDeletingKey(event.keyCode) || !hasAllRowsSelected())
        OutlineView::keyDown(event);
    else if (dataSource() != nullptr)
        dataSource()->deleteSelected(this);
}

void OVFXWMessageOutlineView::reloadRow(std::size_t row)
{
    updateRect(rectOfRow(row));
}

void OVFXWMessageOutlineView::updateRect(const Rect& rect)
{
    if (rect != Rect{})
        setNeedsDisplayInRect(rect);
}

Rect OVFXWMessageOutlineView::frameOfOutlineCellAtRow(std::size_t /*row*/) const
{
    return {};
}

Rect OVFXWMessageOutlineView::frameOfCellAtColumnRow(std::size_t column, std::size_t row) const
{
    Rect frame = OutlineView::frameOfCellAtColumnRow(column, row);
    if (column == 0) {
        frame.x -= shiftToTheLeft;
        frame.width += addedWidth;
    }
    return frame;
}

OVFXWBrowserCell::OVFXWBrowserCell()
{
    setFont(Font::system(messageFontPoints));
}

void OVFXWBrowserCell::setAttributedStringValue(const StyledText& text)
{
    if (text)
        text.addAttributes(attr());
    BrowserCell::setAttributedStringValue(text);
}

const TextStyle& OVFXWBrowserCell::attr()
{
    static const TextStyle style = [] {
        ParagraphStyle paragraph;
        paragraph.lineBreak = LineBreak::TruncateMiddle;
        return TextStyle{{}, {}, paragraph};
    }();
    return style;
}

}  // namespace fixwell
